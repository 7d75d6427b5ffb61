#include "store/PostgresConnection.h"

#include <libpq-fe.h>
#include <poll.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <charconv>
#include <cstring>
#include <sstream>
#include <string_view>
#include <utility>

namespace pelliko::server
{
namespace
{

using Kind = StorageFailure::Kind;
using Remedy = PostgresFailure::Remedy;

// PostgreSQL's numbers of its types.
constexpr std::uint32_t typeBytea = 17;
constexpr std::uint32_t typeBigint = 20;
constexpr std::uint32_t typeText = 25;
constexpr std::uint32_t typeTextArray = 1009;
constexpr std::uint32_t typeBigintArray = 1016;

/// Beyond what the database itself grants a statement: it hangs, or somebody in between does.
constexpr std::chrono::seconds answersPatience{13};
/// A statement that takes longer waits for something that will not come; its request is told to
/// come again. A peer that is silent for the connection's own limits is taken for dead, by either
/// side: a lock whose holder was cut off must not outlive it by the hours that are the system's.
/// Statements are written so that one plan suits all their values; another one each time would cost
/// more than its run.
constexpr const char *sessionSettings = "SET client_min_messages = warning;"
                                        "SET client_encoding = 'UTF8';"
                                        "SET statement_timeout = '10s';"
                                        "SET lock_timeout = '8s';"
                                        "SET idle_in_transaction_session_timeout = '15s';"
                                        "SET tcp_keepalives_idle = 2;"
                                        "SET tcp_keepalives_interval = 1;"
                                        "SET tcp_keepalives_count = 3;"
                                        "SET tcp_user_timeout = 5000;"
                                        "SET plan_cache_mode = force_generic_plan;"
                                        "SET standard_conforming_strings = on";

/// What the library says of each of the hosts that it tried, without its questions.
std::string sentencesOf(const char *message)
{
    std::istringstream lines(message == nullptr ? "" : message);
    std::string all;
    for (std::string line; std::getline(lines, line);) {
        if (line.empty() || line.front() == '\t')
            continue;
        all += (all.empty() ? "" : "; ") + line;
    }
    return all;
}

std::string firstLineOf(const char *message)
{
    const std::string_view text = message == nullptr ? "" : message;
    return std::string(text.substr(0, text.find('\n')));
}

/// What a five-character SQLSTATE means to who asked.
std::pair<Kind, Remedy> meaningOf(std::string_view state)
{
    const auto isOf = [&](std::string_view group) { return state.substr(0, 2) == group; };
    if (state == "40001" || state == "40P01")
        return {Kind::unavailable, Remedy::repeat};
    if (state == "53100")
        return {Kind::full, Remedy::none};
    // A server that became a standby takes no writes: another one does, or will.
    if (isOf("08") || isOf("57") || state == "25006")
        return {Kind::unavailable, state == "57014" ? Remedy::none : Remedy::reconnect};
    if (isOf("53") || state == "55P03" || state == "25P03")
        return {Kind::unavailable, Remedy::none};
    return {Kind::broken, Remedy::none};
}

std::string elementOf(const std::string &value)
{
    if (value.find('\0') != std::string::npos)
        throw StorageFailure(Kind::broken, "metadata: a text has a zero in it");
    std::string element = "\"";
    for (const char c : value) {
        if (c == '"' || c == '\\')
            element += '\\';
        element += c;
    }
    return element + "\"";
}

template <class Values, class Form> std::string arrayOf(const Values &values, Form form)
{
    std::string array = "{";
    for (const auto &value : values) {
        if (array.size() > 1)
            array += ',';
        array += form(value);
    }
    return array + "}";
}

} // namespace

void PostgresValues::add(std::int64_t value)
{
    m_values.push_back({typeBigint, false, false, std::to_string(value)});
}

void PostgresValues::add(const std::string &value)
{
    m_values.push_back({typeText, false, true, value});
}

void PostgresValues::add(const Bytes &bytes)
{
    m_values.push_back({typeBytea, false, true, bytes.value});
}

void PostgresValues::add(const std::optional<std::string> &value)
{
    m_values.push_back({typeText, !value, true, value.value_or("")});
}

void PostgresValues::add(const std::vector<std::string> &values)
{
    m_values.push_back({typeTextArray, false, false, arrayOf(values, elementOf)});
}

void PostgresValues::add(const std::vector<std::int64_t> &values)
{
    m_values.push_back({typeBigintArray, false, false,
                        arrayOf(values, [](std::int64_t value) { return std::to_string(value); })});
}

void PostgresRows::Clear::operator()(pg_result *result) const
{
    PQclear(result);
}

bool PostgresRows::next()
{
    return ++m_row < PQntuples(m_result.get());
}

int PostgresRows::changed() const
{
    const std::string_view count = PQcmdTuples(m_result.get());
    int value = 0;
    std::from_chars(count.data(), count.data() + count.size(), value);
    return value;
}

std::string PostgresRows::text(int column) const
{
    return {PQgetvalue(m_result.get(), m_row, column),
            static_cast<std::size_t>(PQgetlength(m_result.get(), m_row, column))};
}

std::int64_t PostgresRows::integer(int column) const
{
    const std::string value = text(column);
    if (value == "t" || value == "f")
        return value == "t" ? 1 : 0;
    std::int64_t number = 0;
    std::from_chars(value.data(), value.data() + value.size(), number);
    return number;
}

bool PostgresRows::isNull(int column) const
{
    return PQgetisnull(m_result.get(), m_row, column) != 0;
}

void PostgresConnection::Finish::operator()(pg_conn *connection) const
{
    PQfinish(connection);
}

PostgresConnection::PostgresConnection(const std::string &url)
{
    // What stands before the address are defaults, which it may override.
    constexpr std::array<const char *, 10> names{
        "fallback_application_name", "connect_timeout",  "keepalives_idle",
        "keepalives_interval",       "keepalives_count", "tcp_user_timeout",
        "target_session_attrs",      "dbname",           nullptr};
    const std::array<const char *, 10> values{
        "pelliko-server", "5", "2", "1", "3", "5000", "read-write", url.c_str(), nullptr};
    m_connection.reset(PQconnectdbParams(names.data(), values.data(), 1));
    if (!isAlive())
        throw PostgresFailure(Kind::unavailable, Remedy::none,
                              "metadata: " + sentencesOf(PQerrorMessage(get())));
    m_patience = answersPatience;
    PQsetNoticeProcessor(
        get(), [](void *, const char *) {}, nullptr);
    command(sessionSettings);
}

PostgresConnection::~PostgresConnection() = default;

bool PostgresConnection::isAlive() const
{
    return !m_isSilent && PQstatus(get()) == CONNECTION_OK;
}

/// Waits until the database has sent something; false when it has not in time.
bool PostgresConnection::awaitInput()
{
    pollfd wait{PQsocket(get()), POLLIN, 0};
    const int patience = m_patience ? static_cast<int>(m_patience->count()) : -1;
    int ready = -1;
    while (ready < 0) {
        ready = ::poll(&wait, 1, patience);
        if (ready < 0 && errno != EINTR)
            return false;
    }
    return ready > 0;
}

/// The last of the answers to what was sent, or the first that is a refusal.
PostgresRows PostgresConnection::answer(int sent)
{
    std::unique_ptr<pg_result, void (*)(pg_result *)> last(nullptr, PQclear);
    while (sent != 0) {
        while (PQisBusy(get()) != 0) {
            m_isSilent = m_isSilent || !awaitInput();
            if (m_isSilent)
                throw PostgresFailure(Kind::unavailable, Remedy::reconnect,
                                      "metadata: the database does not answer");
            if (PQconsumeInput(get()) == 0)
                break;
        }
        pg_result *result = PQgetResult(get());
        if (result == nullptr)
            break;
        if (last && PQresultStatus(last.get()) == PGRES_FATAL_ERROR)
            PQclear(result);
        else
            last.reset(result);
    }
    return checked(last.release());
}

PostgresRows PostgresConnection::checked(pg_result *result)
{
    PostgresRows rows(result);
    const ExecStatusType status = PQresultStatus(result);
    if (status == PGRES_COMMAND_OK || status == PGRES_TUPLES_OK)
        return rows;
    const char *state = PQresultErrorField(result, PG_DIAG_SQLSTATE);
    auto [kind, remedy] = meaningOf(state == nullptr ? "" : state);
    if (!isAlive() || state == nullptr) {
        kind = kind == Kind::full ? kind : Kind::unavailable;
        remedy = Remedy::reconnect;
    }
    throw PostgresFailure(kind, remedy, "metadata: " + firstLineOf(PQerrorMessage(get())));
}

PostgresRows PostgresConnection::command(const std::string &sql)
{
    return answer(PQsendQuery(get(), sql.c_str()));
}

const std::string &PostgresConnection::prepared(const char *sql, const PostgresValues &values)
{
    const auto found = m_statements.find(sql);
    if (found != m_statements.end())
        return found->second;
    std::vector<Oid> types;
    for (const PostgresValues::Value &value : values.m_values)
        types.push_back(value.type);
    std::string name = "s" + std::to_string(m_statements.size());
    answer(PQsendPrepare(get(), name.c_str(), sql, static_cast<int>(types.size()), types.data()));
    return m_statements.emplace(sql, std::move(name)).first->second;
}

namespace
{

/// Values as libpq wants them; valid as long as they are.
struct Sent {
    std::vector<Oid> types;
    std::vector<const char *> data;
    std::vector<int> lengths;
    std::vector<int> formats;

    [[nodiscard]] int count() const { return static_cast<int>(data.size()); }
};

template <class Values> Sent sentOf(const Values &values)
{
    Sent sent;
    for (const auto &value : values) {
        sent.types.push_back(value.type);
        sent.data.push_back(value.isNull ? nullptr : value.data.c_str());
        sent.lengths.push_back(static_cast<int>(value.data.size()));
        sent.formats.push_back(value.isBinary ? 1 : 0);
    }
    return sent;
}

} // namespace

PostgresRows PostgresConnection::run(const char *sql, const PostgresValues &values)
{
    const std::string &name = prepared(sql, values);
    const Sent sent = sentOf(values.m_values);
    return answer(PQsendQueryPrepared(get(), name.c_str(), sent.count(), sent.data.data(),
                                      sent.lengths.data(), sent.formats.data(), 0));
}

PostgresRows PostgresConnection::once(const std::string &sql, const PostgresValues &values)
{
    const Sent sent = sentOf(values.m_values);
    return answer(PQsendQueryParams(get(), sql.c_str(), sent.count(), sent.types.data(),
                                    sent.data.data(), sent.lengths.data(), sent.formats.data(), 0));
}

void PostgresConnection::copyIn(const std::string &sql, const std::string &lines)
{
    PGresult *begun = PQexec(get(), sql.c_str());
    if (PQresultStatus(begun) != PGRES_COPY_IN) {
        checked(begun);
        throw PostgresFailure(Kind::broken, Remedy::none, "metadata: this is no COPY");
    }
    PQclear(begun);
    // What goes wrong is told by the answer.
    PQputCopyData(get(), lines.data(), static_cast<int>(lines.size()));
    PQputCopyEnd(get(), nullptr);
    answer(1);
}

} // namespace pelliko::server
