#include "store/SqliteTables.h"

#include "DataDirectory.h"
#include "store/StorageFailure.h"

#include <SQLiteCpp/SQLiteCpp.h>
#include <sqlite3.h>

#include <type_traits>
#include <utility>

namespace pelliko::server
{
namespace
{

constexpr int busyMilliseconds = 10000;

[[noreturn]] void fail(const SQLite::Exception &error)
{
    throw StorageFailure(error.getErrorCode() == SQLITE_FULL ? StorageFailure::Kind::full
                                                             : StorageFailure::Kind::broken,
                         std::string("metadata: ") + error.what());
}

template <class Work> auto guarded(Work work)
{
    try {
        return work();
    } catch (const SQLite::Exception &error) {
        fail(error);
    }
}

void bind(SQLite::Statement &statement, int index, const Cell &cell, Column::Kind kind)
{
    if (const auto *number = std::get_if<std::int64_t>(&cell)) {
        statement.bind(index, *number);
    } else if (const auto *text = std::get_if<std::string>(&cell)) {
        if (kind == Column::Kind::bytes)
            statement.bind(index, static_cast<const void *>(text->data()),
                           static_cast<int>(text->size()));
        else
            statement.bind(index, *text);
    } else {
        statement.bind(index);
    }
}

Cell cellOf(const SQLite::Column &column, Column::Kind kind)
{
    if (column.isNull())
        return {};
    if (kind == Column::Kind::integer || kind == Column::Kind::flag)
        return column.getInt64();
    return column.getString();
}

/// "id, number" and "?, ?".
std::pair<std::string, std::string> listsOf(const Table &table)
{
    std::pair<std::string, std::string> lists;
    for (const Column &column : table.columns) {
        const char *comma = lists.first.empty() ? "" : ", ";
        lists.first += comma + std::string(column.name);
        lists.second += comma + std::string("?");
    }
    return lists;
}

class SqliteTables final : public TableSession
{
public:
    explicit SqliteTables(const std::filesystem::path &file)
        : m_directory(file.parent_path()),
          m_database(file.string(), SQLite::OPEN_READWRITE, busyMilliseconds)
    {
        m_database.exec("PRAGMA synchronous = FULL");
        m_database.exec("PRAGMA foreign_keys = ON");
    }

    void query(const std::string &sql, const std::vector<Cell> &values,
               const std::vector<Column::Kind> &columns, const Visitor &visit) override
    {
        guarded([&] {
            SQLite::Statement statement(m_database, sql);
            bindAll(statement, values);
            visitAll(statement, columns, visit);
        });
    }

    std::int64_t change(const std::string &sql, const std::vector<Cell> &values) override
    {
        return guarded([&] {
            SQLite::Statement statement(m_database, sql);
            bindAll(statement, values);
            return std::int64_t{statement.exec()};
        });
    }

    bool hasTable(const std::string &name) override
    {
        return guarded([&] { return m_database.tableExists(name); });
    }

    void begin() override { change("BEGIN IMMEDIATE", {}); }
    void beginAlone() override { change("BEGIN IMMEDIATE", {}); }
    void commit() override { change("COMMIT", {}); }
    void rollBack() noexcept override
    {
        if (sqlite3_get_autocommit(m_database.getHandle()) == 0)
            m_database.tryExec("ROLLBACK");
    }

    void read(const Table &table, const Visitor &visit) override
    {
        std::vector<Column::Kind> kinds;
        for (const Column &column : table.columns)
            kinds.push_back(column.kind);
        query("SELECT " + listsOf(table).first + " FROM " + table.name + " ORDER BY " + table.order,
              {}, kinds, visit);
    }

    void append(const Table &table, const std::vector<TableRow> &rows) override
    {
        guarded([&] {
            const auto [names, marks] = listsOf(table);
            SQLite::Statement statement(m_database, "INSERT INTO " + std::string(table.name) +
                                                        " (" + names + ") VALUES (" + marks + ")");
            for (const TableRow &row : rows) {
                for (std::size_t index = 0; index < row.size(); ++index)
                    bind(statement, static_cast<int>(index) + 1, row[index],
                         table.columns[index].kind);
                statement.exec();
                statement.reset();
            }
        });
    }

    std::int64_t counter(const Table &table) override
    {
        std::int64_t highest = 0;
        query("SELECT seq FROM sqlite_sequence WHERE name = $1", {std::string(table.name)},
              {Column::Kind::integer}, [&](const TableRow &row) { highest = numberIn(row, 0); });
        return highest;
    }

    void setCounter(const Table &table, std::int64_t highest) override
    {
        change("DELETE FROM sqlite_sequence WHERE name = $1", {std::string(table.name)});
        change("INSERT INTO sqlite_sequence (name, seq) VALUES ($1, $2)",
               {std::string(table.name), highest});
    }

    std::shared_ptr<const void> keepServersAway() override
    {
        return tryLock(serversLock(m_directory));
    }
    std::shared_ptr<const void> keepMoversAway() override
    {
        return tryLock(m_directory / "lock.migration");
    }

private:
    static void bindAll(SQLite::Statement &statement, const std::vector<Cell> &values)
    {
        int index = 0;
        for (const Cell &value : values)
            bind(statement, ++index, value, Column::Kind::text);
    }

    static void visitAll(SQLite::Statement &statement, const std::vector<Column::Kind> &columns,
                         const Visitor &visit)
    {
        while (statement.executeStep()) {
            TableRow row;
            row.reserve(columns.size());
            for (std::size_t index = 0; index < columns.size(); ++index)
                row.push_back(cellOf(statement.getColumn(static_cast<int>(index)), columns[index]));
            visit(row);
        }
    }

    std::filesystem::path m_directory;
    SQLite::Database m_database;
};

} // namespace

std::unique_ptr<TableSession> openSqliteTables(const std::filesystem::path &file)
{
    return guarded([&] { return std::make_unique<SqliteTables>(file); });
}

} // namespace pelliko::server
