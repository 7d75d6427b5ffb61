#pragma once

#include "store/Bytes.h"
#include "store/StorageFailure.h"

#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <unordered_map>
#include <vector>

struct pg_conn;
struct pg_result;

namespace pelliko::server
{

/// What PostgreSQL refused, or that it cannot be reached.
class PostgresFailure : public StorageFailure
{
public:
    /// What the caller of a transaction may do about it.
    enum class Remedy {
        none,
        /// Two transactions stood in each other's way and this one was undone.
        repeat,
        /// The connection is gone; nothing that was not committed has happened.
        reconnect
    };

    PostgresFailure(Kind kind, Remedy remedy, const std::string &what)
        : StorageFailure(kind, what), m_remedy(remedy)
    {
    }

    [[nodiscard]] Remedy remedy() const { return m_remedy; }

private:
    Remedy m_remedy;
};

/// The values of one run of a statement, in the form in which they are sent.
class PostgresValues
{
public:
    template <class... Values> explicit PostgresValues(const Values &...values)
    {
        m_values.reserve(sizeof...(values));
        (add(values), ...);
    }

    void add(std::int64_t value);
    void add(std::uint64_t value) { add(static_cast<std::int64_t>(value)); }
    void add(int value) { add(std::int64_t{value}); }
    void add(const std::string &value);
    void add(const Bytes &bytes);
    void add(const std::optional<std::string> &value);
    void add(const std::vector<std::string> &values);
    void add(const std::vector<std::int64_t> &values);

private:
    friend class PostgresConnection;
    struct Value {
        std::uint32_t type = 0;
        bool isNull = false;
        /// As raw bytes with a length: a text with a zero in it is refused, not cut.
        bool isBinary = false;
        std::string data;
    };

    std::vector<Value> m_values;
};

/// The rows that a statement gave, all of them in memory.
class PostgresRows
{
public:
    explicit PostgresRows(pg_result *result) : m_result(result) {}

    [[nodiscard]] bool next();
    /// How many rows the statement changed.
    [[nodiscard]] int changed() const;

    [[nodiscard]] std::string text(int column) const;
    [[nodiscard]] std::int64_t integer(int column) const;
    [[nodiscard]] std::uint64_t size(int column) const
    {
        return static_cast<std::uint64_t>(integer(column));
    }
    [[nodiscard]] bool isNull(int column) const;

private:
    struct Clear {
        void operator()(pg_result *result) const;
    };
    std::unique_ptr<pg_result, Clear> m_result;
    int m_row = -1;
};

/// One session of a PostgreSQL server with its prepared statements. One thread at a time.
class PostgresConnection
{
public:
    /// Throws PostgresFailure when the server cannot be reached or does not let this one in.
    explicit PostgresConnection(const std::string &url);
    ~PostgresConnection();
    PostgresConnection(const PostgresConnection &) = delete;
    PostgresConnection &operator=(const PostgresConnection &) = delete;

    /// Runs a statement, prepared once per literal, with the values as $1, $2, ….
    template <class... Values> PostgresRows query(const char *sql, const Values &...values)
    {
        return run(sql, PostgresValues(values...));
    }

    /// Runs a statement that is not worth preparing.
    PostgresRows once(const std::string &sql, const PostgresValues &values);

    /// Runs a COPY FROM STDIN of these lines.
    void copyIn(const std::string &sql, const std::string &lines);

    /// Runs commands without values; returns the last one's rows.
    PostgresRows command(const std::string &sql);

    /// From here on an answer is waited for as long as it takes.
    void waitForever() { m_patience.reset(); }

    /// False once the session has ended.
    [[nodiscard]] bool isAlive() const;

    /// libpq's own, for notifications and waiting.
    [[nodiscard]] pg_conn *get() const { return m_connection.get(); }

private:
    struct Finish {
        void operator()(pg_conn *connection) const;
    };
    PostgresRows run(const char *sql, const PostgresValues &values);
    const std::string &prepared(const char *sql, const PostgresValues &values);
    PostgresRows answer(int sent);
    bool awaitInput();
    PostgresRows checked(pg_result *result);

    std::unique_ptr<pg_conn, Finish> m_connection;
    std::optional<std::chrono::milliseconds> m_patience;
    /// Something that was asked was never answered: whatever came now would belong to it.
    bool m_isSilent = false;
    std::unordered_map<const char *, std::string> m_statements;
};

} // namespace pelliko::server
