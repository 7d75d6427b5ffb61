#pragma once

#include "store/Bytes.h"
#include "store/SqliteMetadata.h"
#include "store/StorageFailure.h"

#include <SQLiteCpp/SQLiteCpp.h>

#include <memory>
#include <mutex>
#include <string>
#include <type_traits>
#include <unordered_map>

namespace pelliko::server
{

/// One run of a prepared statement, reset at its end: a statement left in mid-step would keep its
/// view of the database open and the write-ahead log growing.
class Query
{
public:
    template <class... Values>
    explicit Query(SQLite::Statement &statement, const Values &...values) : m_statement(statement)
    {
        [[maybe_unused]] int index = 0;
        (bind(++index, values), ...);
    }
    Query(const Query &) = delete;
    Query &operator=(const Query &) = delete;
    ~Query() { m_statement.tryReset(); }

    [[nodiscard]] bool next() { return m_statement.executeStep(); }
    /// For statements without rows; returns how many rows were changed.
    int run() { return m_statement.exec(); }

    [[nodiscard]] std::string text(int column) const { return m_statement.getColumn(column); }
    [[nodiscard]] std::int64_t integer(int column) const
    {
        return m_statement.getColumn(column).getInt64();
    }
    [[nodiscard]] std::uint64_t size(int column) const
    {
        return static_cast<std::uint64_t>(integer(column));
    }
    [[nodiscard]] bool isNull(int column) const { return m_statement.isColumnNull(column); }

private:
    void bind(int index, std::int64_t value) { m_statement.bind(index, value); }
    void bind(int index, std::uint64_t value) { bind(index, static_cast<std::int64_t>(value)); }
    void bind(int index, int value) { m_statement.bind(index, value); }
    void bind(int index, const std::string &value) { m_statement.bind(index, value); }
    void bind(int index, const Bytes &bytes)
    {
        m_statement.bind(index, bytes.value.data(), static_cast<int>(bytes.value.size()));
    }
    void bind(int index, const std::optional<std::string> &value)
    {
        if (value)
            m_statement.bind(index, *value);
        else
            m_statement.bind(index);
    }

    SQLite::Statement &m_statement;
};

struct ShareRow;

/// The open database with its prepared statements; private to the SqliteMetadata sources.
struct SqliteMetadata::Connection {
    explicit Connection(const std::filesystem::path &file);

    /// Binds the values to parameters 1, 2, … of a statement that is prepared once per literal.
    template <class... Values> Query query(const char *sql, const Values &...values);

    /// Runs `work` in one immediate transaction, alone on this connection.
    template <class Work> auto write(Work work) -> std::invoke_result_t<Work>;
    /// Runs `work` on one consistent state, alone on this connection.
    template <class Work> auto read(Work work) -> std::invoke_result_t<Work>;

    // The steps of the calls below run inside a write or read.
    std::optional<ShareRow> findShare(std::int64_t account, const std::string &key, Seconds now);
    ShareRow shareById(std::int64_t id, Seconds now);
    void addParts(ShareRow &share);
    /// Makes the share end in `state` at `now`; returns the keys of the blobs it had.
    std::vector<std::string> endShare(const ShareRow &share, ShareState state, Seconds now);

    /// Sorts the share's recipients into those that get a push, which is made, and those of an SMS.
    void tellRecipients(const ShareRow &share, FinishResult &result);
    /// Makes the push unless the account has one for this share; true when it was made.
    bool addPush(std::int64_t account, std::int64_t share);
    /// The pushes of a share that has ended wait no more.
    void dropPushes(std::int64_t share);

    RegisterResult redeem(const Registration &registration);
    bool repeat(const Registration &registration);
    bool makeOrRenew(const Registration &registration, bool renew);

    /// Seconds until the share fits the account's limit; nothing when it fits now.
    std::optional<Seconds> waitForLimit(const NewShare &share);
    /// Seconds until the question fits the account's limit; nothing when it fits now.
    std::optional<Seconds> waitForNumbers(const JoinedQuestion &question);
    std::optional<std::int64_t> shareOfKey(const NewShare &share);
    std::int64_t addShareRow(const NewShare &share);
    /// With `blob` the file has bytes that are stored already.
    void addFile(std::int64_t share, int position, const NewFile &file,
                 std::optional<std::int64_t> blob);
    std::int64_t copyShare(const NewShare &share, const ShareRow &source);
    CreateResult reshare(const NewShare &share);

    SQLite::Database database;

private:
    template <class Work>
    auto transact(SQLite::TransactionBehavior behavior, Work work) -> std::invoke_result_t<Work>;
    SQLite::Statement &prepared(const char *sql);
    void migrate(const std::filesystem::path &file);
    [[noreturn]] void fail(const SQLite::Exception &error);

    std::mutex m_mutex;
    std::unordered_map<const char *, std::unique_ptr<SQLite::Statement>> m_statements;
};

template <class... Values>
Query SqliteMetadata::Connection::query(const char *sql, const Values &...values)
{
    return Query(prepared(sql), values...);
}

template <class Work>
auto SqliteMetadata::Connection::transact(SQLite::TransactionBehavior behavior, Work work)
    -> std::invoke_result_t<Work>
{
    const std::lock_guard lock(m_mutex);
    try {
        SQLite::Transaction transaction(database, behavior);
        if constexpr (std::is_void_v<std::invoke_result_t<Work>>) {
            work();
            transaction.commit();
        } else {
            auto result = work();
            transaction.commit();
            return result;
        }
    } catch (const SQLite::Exception &error) {
        fail(error);
    }
}

template <class Work>
auto SqliteMetadata::Connection::write(Work work) -> std::invoke_result_t<Work>
{
    return transact(SQLite::TransactionBehavior::IMMEDIATE, work);
}

template <class Work> auto SqliteMetadata::Connection::read(Work work) -> std::invoke_result_t<Work>
{
    return transact(SQLite::TransactionBehavior::DEFERRED, work);
}

} // namespace pelliko::server
