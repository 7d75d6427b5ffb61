#include "PellikoDatabaseManager/SmsJournal.h"

#include "AppLog/AppLog.h"

#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <sqlite3.h>
#include <sys/file.h>
#include <unistd.h>

namespace pelliko
{

namespace
{

constexpr const char *databasePath = "/opt/usr/apps/com.velmora.pelliko/data/.pelliko-messages.db";
constexpr const char *lockPath = "/opt/usr/apps/com.velmora.pelliko/data/.pelliko-messages.lock";
constexpr const char *databaseFiles[] = {"", "-wal", "-shm"};
constexpr int busyMs = 60'000; ///< a backup may hold the file

// Rows are kept for far longer than the service asks for the messages of any share.
constexpr const char *prepareStatements =
    "PRAGMA journal_mode = WAL; PRAGMA synchronous = FULL;"
    "CREATE TABLE IF NOT EXISTS messages (share TEXT NOT NULL, number TEXT NOT NULL,"
    " state INTEGER NOT NULL, text TEXT NOT NULL, begun_at INTEGER NOT NULL,"
    " PRIMARY KEY (share, number)) WITHOUT ROWID;"
    "DELETE FROM messages WHERE begun_at < unixepoch() - 90 * 86400;";

struct Finalize {
    void operator()(sqlite3_stmt *statement) const { sqlite3_finalize(statement); }
};
using Statement = std::unique_ptr<sqlite3_stmt, Finalize>;

Statement _compile(sqlite3 *database, const char *text)
{
    sqlite3_stmt *statement = nullptr;
    sqlite3_prepare_v2(database, text, -1, &statement, nullptr);
    return Statement(statement);
}

void _bind(const Statement &statement, int position, const std::string &text)
{
    sqlite3_bind_text(statement.get(), position, text.data(), static_cast<int>(text.size()),
                      SQLITE_TRANSIENT);
}

std::string _text(const Statement &statement, int column)
{
    const auto *text = reinterpret_cast<const char *>(sqlite3_column_text(statement.get(), column));
    const int size = sqlite3_column_bytes(statement.get(), column);
    return text ? std::string(text, static_cast<size_t>(size)) : std::string();
}

// Held as long as the file is open, and never by a dead process.
int _lock()
{
    const int file = ::open(lockPath, O_RDWR | O_CREAT | O_CLOEXEC, 0600);
    int result = file < 0 ? -1 : flock(file, LOCK_EX);
    while (file >= 0 && result != 0 && errno == EINTR)
        result = flock(file, LOCK_EX);
    if (result == 0)
        return file;
    LOG_ERROR("Message journal: no lock: %s", strerror(errno));
    if (file >= 0)
        close(file);
    return -1;
}

// A broken journal would stop the messages of every share to come.
void _removeDatabase()
{
    for (const char *end : databaseFiles)
        unlink((std::string(databasePath) + end).c_str());
}

} // namespace

SmsJournal::SmsJournal(std::string key, int lock) : key_(std::move(key)), lock_(lock) {}

SmsJournal::~SmsJournal()
{
    sqlite3_close(database_);
    close(lock_);
}

std::unique_ptr<SmsJournal> SmsJournal::open(const std::string &key)
{
    const int lock = _lock();
    if (lock < 0)
        return nullptr;
    std::unique_ptr<SmsJournal> journal(new SmsJournal(key, lock));
    int result = journal->prepare();
    if (result == SQLITE_NOTADB || result == SQLITE_CORRUPT) {
        _removeDatabase();
        result = journal->prepare();
    }
    return result == SQLITE_OK ? std::move(journal) : nullptr;
}

int SmsJournal::prepare()
{
    sqlite3_close(database_);
    int result = sqlite3_open(databasePath, &database_);
    if (result == SQLITE_OK)
        result = sqlite3_busy_timeout(database_, busyMs);
    if (result == SQLITE_OK)
        result = sqlite3_exec(database_, prepareStatements, nullptr, nullptr, nullptr);
    if (result != SQLITE_OK)
        LOG_ERROR("Message journal: not opened: %s", sqlite3_errmsg(database_));
    return result;
}

std::optional<SmsEntry> SmsJournal::find(const std::string &number)
{
    const Statement query =
        _compile(database_, "SELECT state, text FROM messages WHERE share = ? AND number = ?");
    _bind(query, 1, key_);
    _bind(query, 2, number);
    switch (sqlite3_step(query.get())) {
    case SQLITE_ROW:
        return SmsEntry{static_cast<SmsState>(sqlite3_column_int(query.get(), 0)), _text(query, 1)};
    case SQLITE_DONE:
        return SmsEntry{};
    default:
        LOG_ERROR("Message journal: not read: %s", sqlite3_errmsg(database_));
        return std::nullopt;
    }
}

bool SmsJournal::begin(const std::string &number, const std::string &text)
{
    return change("INSERT INTO messages VALUES (?1, ?2, ?3, ?4, unixepoch())"
                  " ON CONFLICT DO UPDATE SET state = ?3, text = ?4",
                  number, static_cast<int>(SmsState::sending), text);
}

bool SmsJournal::settle(const std::string &number, SmsState state)
{
    return change("UPDATE messages SET state = ?3, text = ?4 WHERE share = ?1 AND number = ?2",
                  number, static_cast<int>(state), "");
}

bool SmsJournal::change(const char *statement, const std::string &number, int state,
                        const std::string &text)
{
    const Statement compiled = _compile(database_, statement);
    _bind(compiled, 1, key_);
    _bind(compiled, 2, number);
    sqlite3_bind_int(compiled.get(), 3, state);
    _bind(compiled, 4, text);
    if (sqlite3_step(compiled.get()) == SQLITE_DONE)
        return true;
    LOG_ERROR("Message journal: not written: %s", sqlite3_errmsg(database_));
    return false;
}

} // namespace pelliko
