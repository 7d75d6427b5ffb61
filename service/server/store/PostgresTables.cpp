#include "store/PostgresTables.h"

#include "store/PostgresConnection.h"
#include "store/PostgresLayout.h"

#include <string_view>
#include <utility>

namespace pelliko::server
{
namespace
{

/// Rows in memory at a time.
constexpr const char *fetchSome = "FETCH FORWARD 2000 FROM rows_of_table";

constexpr std::string_view digits = "0123456789abcdef";

std::string hexOf(const std::string &bytes)
{
    std::string hex;
    for (const char c : bytes) {
        hex += digits[static_cast<unsigned char>(c) >> 4U];
        hex += digits[static_cast<unsigned char>(c) & 15U];
    }
    return hex;
}

std::string bytesOf(const std::string &hex)
{
    std::string bytes;
    for (std::size_t at = 0; at + 1 < hex.size(); at += 2)
        bytes += static_cast<char>((digits.find(hex[at]) << 4U) | digits.find(hex[at + 1]));
    return bytes;
}

/// As it stands in a line of COPY.
std::string escaped(const std::string &text)
{
    std::string line;
    for (const char c : text) {
        switch (c) {
        case '\\':
            line += "\\\\";
            break;
        case '\t':
            line += "\\t";
            break;
        case '\n':
            line += "\\n";
            break;
        case '\r':
            line += "\\r";
            break;
        case '\0':
            throw StorageFailure(StorageFailure::Kind::broken,
                                 "metadata: a text has a zero in it, which PostgreSQL cannot keep");
        default:
            line += c;
        }
    }
    return line;
}

std::string fieldOf(const Cell &cell, Column::Kind kind)
{
    if (const auto *number = std::get_if<std::int64_t>(&cell)) {
        if (kind == Column::Kind::flag)
            return *number != 0 ? "t" : "f";
        return std::to_string(*number);
    }
    const auto *text = std::get_if<std::string>(&cell);
    if (text == nullptr)
        return "\\N";
    return kind == Column::Kind::bytes ? "\\\\x" + hexOf(*text) : escaped(*text);
}

Cell cellOf(const PostgresRows &rows, int column, Column::Kind kind)
{
    if (rows.isNull(column))
        return {};
    if (kind == Column::Kind::integer || kind == Column::Kind::flag)
        return rows.integer(column);
    return kind == Column::Kind::bytes ? bytesOf(rows.text(column)) : rows.text(column);
}

std::string joined(const Table &table, bool forReading)
{
    std::string list;
    for (const Column &column : table.columns) {
        const std::string name = column.name;
        const bool encoded = forReading && column.kind == Column::Kind::bytes;
        list += (list.empty() ? "" : ", ") + (encoded ? "encode(" + name + ", 'hex')" : name);
    }
    return list;
}

/// Waits as long as the session does for locks: that of a program which has just ended is let go a
/// moment later. False when somebody keeps it.
bool waitForLock(PostgresConnection &db, const char *statement, int which)
{
    try {
        db.query(statement, lockGroup, which);
        return true;
    } catch (const PostgresFailure &failure) {
        if (!db.isAlive() || failure.kind() != StorageFailure::Kind::unavailable)
            throw;
        return false;
    }
}

class PostgresTables final : public TableSession
{
public:
    explicit PostgresTables(const std::string &url)
        : m_db(std::make_shared<PostgresConnection>(url))
    {
        m_db->command("SET statement_timeout = 0; SET idle_in_transaction_session_timeout = 0");
        m_db->waitForever();
    }

    void query(const std::string &sql, const std::vector<Cell> &values,
               const std::vector<Column::Kind> &columns, const Visitor &visit) override
    {
        visitAll(m_db->once(sql, valuesOf(values)), columns, visit);
    }

    std::int64_t change(const std::string &sql, const std::vector<Cell> &values) override
    {
        return m_db->once(sql, valuesOf(values)).changed();
    }

    bool hasTable(const std::string &name) override
    {
        PostgresRows row = m_db->query("SELECT to_regclass($1) IS NOT NULL", name);
        return row.next() && row.integer(0) != 0;
    }

    void begin() override { m_db->command("BEGIN ISOLATION LEVEL REPEATABLE READ"); }

    /// Others may read meanwhile. What they are about to change is waited for by the locks, before
    /// the first look.
    void beginAlone() override
    {
        begin();
        for (const Table &table : metadataTables())
            m_db->command("LOCK TABLE " + std::string(table.name) + " IN SHARE ROW EXCLUSIVE MODE");
    }

    void commit() override { m_db->command("COMMIT"); }

    void rollBack() noexcept override
    {
        try {
            m_db->command("ROLLBACK");
        } catch (const std::exception &) {
            // A session that is gone has nothing to undo.
        }
    }

    void read(const Table &table, const Visitor &visit) override
    {
        std::vector<Column::Kind> kinds;
        for (const Column &column : table.columns)
            kinds.push_back(column.kind);
        m_db->command("DECLARE rows_of_table NO SCROLL CURSOR FOR SELECT " + joined(table, true) +
                      " FROM " + table.name + " ORDER BY " + table.order);
        while (visitAll(m_db->command(fetchSome), kinds, visit)) {
        }
        m_db->command("CLOSE rows_of_table");
    }

    void append(const Table &table, const std::vector<TableRow> &rows) override
    {
        std::string lines;
        for (const TableRow &row : rows) {
            for (std::size_t index = 0; index < row.size(); ++index) {
                if (index > 0)
                    lines += '\t';
                lines += fieldOf(row[index], table.columns[index].kind);
            }
            lines += '\n';
        }
        m_db->copyIn("COPY " + std::string(table.name) + " (" + joined(table, false) +
                         ") FROM STDIN",
                     lines);
    }

    std::int64_t counter(const Table &table) override
    {
        PostgresRows row = m_db->command(
            "SELECT CASE WHEN is_called THEN last_value ELSE 0 END FROM " + sequenceOf(table));
        return row.next() ? row.integer(0) : 0;
    }

    void setCounter(const Table &table, std::int64_t highest) override
    {
        if (highest > 0)
            m_db->query("SELECT setval($1::regclass, $2)", sequenceOf(table), highest);
    }

    std::shared_ptr<const void> keepServersAway() override
    {
        return tryAdvisoryLock(lockOfServing);
    }
    std::shared_ptr<const void> keepMoversAway() override { return tryAdvisoryLock(lockOfMoving); }

private:
    static PostgresValues valuesOf(const std::vector<Cell> &cells)
    {
        PostgresValues values;
        for (const Cell &cell : cells) {
            if (const auto *number = std::get_if<std::int64_t>(&cell))
                values.add(*number);
            else
                values.add(std::get<std::string>(cell));
        }
        return values;
    }

    /// False when there were no rows.
    static bool visitAll(PostgresRows rows, const std::vector<Column::Kind> &columns,
                         const Visitor &visit)
    {
        bool any = false;
        while (rows.next()) {
            any = true;
            TableRow row;
            row.reserve(columns.size());
            for (std::size_t index = 0; index < columns.size(); ++index)
                row.push_back(cellOf(rows, static_cast<int>(index), columns[index]));
            visit(row);
        }
        return any;
    }

    /// The name that the engine gave it.
    std::string sequenceOf(const Table &table)
    {
        PostgresRows row =
            m_db->query("SELECT pg_get_serial_sequence($1, 'id')", std::string(table.name));
        return row.next() ? row.text(0) : std::string();
    }

    std::shared_ptr<const void> tryAdvisoryLock(int which)
    {
        m_db->command("SET lock_timeout = '3s'");
        const bool got =
            waitForLock(*m_db, "SELECT pg_advisory_lock($1::bigint::int, $2::bigint::int)", which);
        m_db->command("SET lock_timeout = '8s'");
        // Locks end with their session.
        return got ? m_db : nullptr;
    }

    std::shared_ptr<PostgresConnection> m_db;
};

} // namespace

std::unique_ptr<TableSession> openPostgresTables(const std::string &url)
{
    return std::make_unique<PostgresTables>(url);
}

std::shared_ptr<const void> takePartInServing(const std::string &url)
{
    auto session = std::make_shared<PostgresConnection>(url);
    return takePartInServing(*session) ? session : nullptr;
}

bool takePartInServing(PostgresConnection &db)
{
    return waitForLock(db, "SELECT pg_advisory_lock_shared($1::bigint::int, $2::bigint::int)",
                       lockOfServing);
}

} // namespace pelliko::server
