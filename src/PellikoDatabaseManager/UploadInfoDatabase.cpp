#include "PellikoDatabaseManager/UploadInfoDatabase.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/Decimal.h"
#include "PellikoDatabaseManager/FileListText.h"

#include <cstdio>
#include <cstring>
#include <glib.h>
#include <memory>
#include <sqlite3.h>
#include <string>

namespace pelliko
{

namespace
{

constexpr const char *databasePath = "/opt/usr/apps/com.velmora.pelliko/data/.pelliko.db";
constexpr const char *brokenPath = "/opt/usr/apps/com.velmora.pelliko/data/.pelliko.db.broken";
constexpr const char *tableName = "UPLOAD_INFO";

struct SqliteFree {
    void operator()(char *text) const { sqlite3_free(text); }
};
using SqliteText = std::unique_ptr<char, SqliteFree>;

struct ExecResult {
    int code;
    SqliteText error;
    bool ok() const { return code == SQLITE_OK; }
    const char *text() const { return textOrNull(error.get()); }
};

sqlite3 *_openFile()
{
    sqlite3 *handle = nullptr;
    if (sqlite3_open(databasePath, &handle) != SQLITE_OK) {
        LOG_ERROR("DB open Failed - %s", sqlite3_errmsg(handle));
        sqlite3_close(handle);
        return nullptr;
    }
    return handle;
}

bool _isDamaged(sqlite3 *handle)
{
    sqlite3_stmt *check = nullptr;
    int code = sqlite3_prepare_v2(handle, "PRAGMA quick_check(1)", -1, &check, nullptr);
    if (code == SQLITE_OK)
        code = sqlite3_step(check);
    const bool sound =
        code != SQLITE_ROW ||
        strcmp(reinterpret_cast<const char *>(sqlite3_column_text(check, 0)), "ok") == 0;
    sqlite3_finalize(check);
    return !sound || code == SQLITE_NOTADB || code == SQLITE_CORRUPT;
}

// An upload that has no row is given up when a restart interrupts it: a file that takes no rows
// any more must not stay.
sqlite3 *_openDatabase()
{
    sqlite3 *handle = _openFile();
    if (handle && _isDamaged(handle)) {
        LOG_ERROR("DB is damaged, it is kept as %s", brokenPath);
        sqlite3_close(handle);
        rename(databasePath, brokenPath);
        handle = _openFile();
    }
    if (!handle)
        return nullptr;
    // The insert writes texts in double quotes; a library may be built to refuse that.
    sqlite3_db_config(handle, SQLITE_DBCONFIG_DQS_DML, 1, nullptr);
    LOG_DEBUG("DB Opened Successfully.");
    return handle;
}

// Opened by the first caller and kept; null when that opening failed, which is not tried again.
sqlite3 *_getDatabaseHandle()
{
    static sqlite3 *const handle = _openDatabase();
    return handle;
}

// SQLite takes a statement that could not be written for an empty one and calls it done.
ExecResult _execute(sqlite3 *handle, const char *statement,
                    int (*row)(void *, int, char **, char **) = nullptr)
{
    if (!statement)
        return {SQLITE_NOMEM, nullptr};
    char *error = nullptr;
    const int code = sqlite3_exec(handle, statement, row, nullptr, &error);
    return {code, SqliteText(error)};
}

void _logExecutionError(const char *text, int code)
{
    LOG_ERROR("SQL query execution error: %s and return value = %d", text, code);
}

bool _hasQuote(const char *text)
{
    return text && strchr(text, '"');
}

// A text that holds a double quote breaks out of its quotes and could turn the insert into any
// other statement: it is compiled for its error message and never run.
void _refuseStatement(sqlite3 *handle, const char *statement)
{
    sqlite3_stmt *compiled = nullptr;
    const int code = sqlite3_prepare_v2(handle, statement, -1, &compiled, nullptr);
    if (code == SQLITE_OK)
        _logExecutionError(sqlite3_errstr(SQLITE_ERROR), SQLITE_ERROR);
    else
        _logExecutionError(sqlite3_errmsg(handle), code);
    sqlite3_finalize(compiled);
}

char *_fixedCopy(const char *text, size_t size)
{
    auto *copy = static_cast<char *>(g_malloc0(size));
    if (text)
        g_strlcpy(copy, text, size);
    return copy;
}

void _readColumn(UploadNotiData &node, int column, const char *value)
{
    switch (column) {
    case 0:
        node.request_id = decimalValue(value);
        break;
    case 1:
        node.total_files = decimalValue(value);
        break;
    case 2:
        node.total_size = decimalValue(value);
        break;
    case 3:
        if (value)
            node.file_list = splitFileList(value, node.total_files);
        else
            LOG_DEBUG("empty file list received from database..!!!");
        break;
    case 4:
        node.recipient_list = _fixedCopy(value, recipientListSize);
        break;
    case 5:
        node.recipient_index_list = _fixedCopy(value, recipientIndexSize);
        break;
    default:
        LOG_ERROR("Some db error occurred...");
    }
}

int _dbReadCb(void *, int count, char **values, char **)
{
    LOG_DEBUG("Row returned from database...");
    UploadNotiData *node = addUploadNotiDataNode();
    for (int column = 0; node && column < count; ++column)
        _readColumn(*node, column, values[column]);
    return 0;
}

} // namespace

bool createTableUploadInfoDb()
{
    sqlite3 *handle = _getDatabaseHandle();
    const SqliteText statement(sqlite3_mprintf(
        "CREATE TABLE IF NOT EXISTS %Q (req_id INT PRIMARY KEY NOT NULL, total_files INT, "
        "total_size INT, file_list VARCHAR, recipient_list VARCHAR, recipient_index_list VARCHAR);",
        tableName));
    LOG_DEBUG("SQL query framed is = %s", textOrNull(statement.get()));
    const ExecResult result = _execute(handle, statement.get());
    if (!result.ok()) {
        LOG_ERROR("Error in table create. SQL query execution error: %s and return value = %d",
                  result.text(), result.code);
        return false;
    }
    LOG_DEBUG("Table UPLOAD_INFO created successfully");
    return true;
}

void writeUploadDataToDb(const UploadNotiData *node)
{
    RETURN_IF_NULL(node, "node is NULL");
    sqlite3 *handle = _getDatabaseHandle();
    const std::string files = fileListText(node->file_list, node->total_files);
    const SqliteText statement(
        sqlite3_mprintf("INSERT into %s VALUES (%d, %d, %ld, \"%s\", \"%s\", \"%s\");", tableName,
                        node->request_id, node->total_files, static_cast<long>(node->total_size),
                        files.c_str(), node->recipient_list, node->recipient_index_list));
    if (statement && (_hasQuote(files.c_str()) || _hasQuote(node->recipient_list) ||
                      _hasQuote(node->recipient_index_list))) {
        _refuseStatement(handle, statement.get());
        return;
    }
    const ExecResult result = _execute(handle, statement.get());
    if (result.ok())
        LOG_DEBUG("Records created successfully...");
    else
        _logExecutionError(result.text(), result.code);
}

bool readUploadDataFromDb()
{
    sqlite3 *handle = _getDatabaseHandle();
    const SqliteText statement(sqlite3_mprintf("SELECT * FROM %Q;", tableName));
    const ExecResult result = _execute(handle, statement.get(), _dbReadCb);
    if (!result.ok()) {
        _logExecutionError(result.text(), result.code);
        return false;
    }
    LOG_DEBUG("Records read successfully...");
    return true;
}

void deleteUploadDataFromDb(int32_t request_id)
{
    sqlite3 *handle = _getDatabaseHandle();
    const SqliteText statement(
        sqlite3_mprintf("DELETE FROM %Q where req_id = %d;", tableName, request_id));
    const ExecResult result = _execute(handle, statement.get());
    if (result.ok())
        LOG_DEBUG("Records deleted successfully...");
    else
        _logExecutionError(result.text(), result.code);
}

void deleteUploadInfoDb()
{
    if (remove(databasePath) == 0)
        LOG_DEBUG("Database file deleted successfully...!!!");
    else
        LOG_ERROR("Database deletion failed...!!!");
}

} // namespace pelliko
