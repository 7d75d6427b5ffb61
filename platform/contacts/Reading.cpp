// contacts_db_*: records out of the tables.
#include <memory>

#include <SQLiteCpp/SQLiteCpp.h>

#include "Connection.h"
#include "Database.h"
#include "FilterSql.h"
#include "Records.h"

namespace pelliko::contacts
{
namespace
{

void bind(SQLite::Statement &statement, const std::vector<SqlValue> &values)
{
    int at = 0;
    for (const SqlValue &value : values) {
        ++at;
        std::visit([&](const auto &plain) { statement.bind(at, plain); }, value);
    }
}

std::unique_ptr<__contacts_record_h> recordOf(const View &view, SQLite::Statement &row)
{
    auto record = std::make_unique<__contacts_record_h>();
    record->view = &view;
    for (const Property &property : view.properties) {
        if (!property.isReadable())
            continue;
        const SQLite::Column column = row.getColumn(static_cast<int>(record->values.size()));
        if (column.isNull())
            record->values.emplace_back();
        else if (property.type == ValueType::Text)
            record->values.emplace_back(column.getString());
        else
            record->values.emplace_back(column.getInt());
    }
    return record;
}

int readRecord(const View &view, int record_id, contacts_record_h *record)
{
    SQLite::Database *database = threadDatabase();
    if (!database)
        return CONTACTS_ERROR_IPC;
    SQLite::Statement select(*database, selectFrom(view) + " WHERE " + view.id_column + " = ?");
    select.bind(1, record_id);
    if (!select.executeStep())
        return CONTACTS_ERROR_NO_DATA;
    *record = recordOf(view, select).release();
    return CONTACTS_ERROR_NONE;
}

int readList(const View &view, const Conditions &row, int offset, int limit, contacts_list_h *list)
{
    SQLite::Database *database = threadDatabase();
    if (!database)
        return CONTACTS_ERROR_IPC;
    const SqlText text = selectText(view, row, offset, limit);
    SQLite::Statement select(*database, text.text);
    bind(select, text.values);
    auto result = std::make_unique<__contacts_list_h>();
    while (select.executeStep())
        result->records.push_back(recordOf(view, select));
    *list = result.release();
    return CONTACTS_ERROR_NONE;
}

int readListSafely(const View &view, const Conditions &row, int offset, int limit,
                   contacts_list_h *list) noexcept
{
    try {
        return readList(view, row, offset, limit, list);
    } catch (...) {
        return errorOfException();
    }
}

} // namespace
} // namespace pelliko::contacts

using namespace pelliko::contacts;

extern "C" int contacts_db_get_record(const char *view_uri, int record_id,
                                      contacts_record_h *record)
{
    const View *view = findView(view_uri);
    if (!view || !view->id_column || !record)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    try {
        return readRecord(*view, record_id, record);
    } catch (...) {
        return errorOfException();
    }
}

extern "C" int contacts_db_get_all_records(const char *view_uri, int offset, int limit,
                                           contacts_list_h *record_list)
{
    const View *view = findView(view_uri);
    if (!view || offset < 0 || limit < 0 || !record_list)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    return readListSafely(*view, {}, offset, limit, record_list);
}

extern "C" int contacts_db_get_records_with_query(contacts_query_h query, int offset, int limit,
                                                  contacts_list_h *record_list)
{
    if (!query || offset < 0 || limit < 0 || !record_list)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    return readListSafely(*query->view, query->row, offset, limit, record_list);
}
