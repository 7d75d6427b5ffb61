#pragma once

#include "store/BackOff.h"
#include "store/PostgresConnection.h"

#include <chrono>
#include <condition_variable>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <type_traits>
#include <vector>

namespace pelliko::server
{

/// A bounded number of sessions that threads share, and the transactions on them. What may be run
/// again after a lost session or a deadlock is; while the server cannot be reached, calls fail at
/// once but for one that tries, at growing distances. Thread-safe.
class PostgresPool
{
public:
    /// Opens no session yet.
    PostgresPool(std::string url, std::size_t connections);

    [[nodiscard]] const std::string &url() const { return m_url; }

    /// Runs `work` in one transaction, which has happened when this returns, and has not when it
    /// throws, also when the session was lost in between. May run `work` several times.
    template <class Work> auto write(Work work)
    {
        return withResult(work, [this](const Body &body) { transact(body, Mode::write); });
    }
    /// Runs `work` on one consistent state.
    template <class Work> auto read(Work work)
    {
        return withResult(work, [this](const Body &body) { transact(body, Mode::read); });
    }
    /// Runs `work` of one statement that does no harm when it is run twice: a round trip.
    template <class Work> auto single(Work work)
    {
        return withResult(work, [this](const Body &body) { transact(body, Mode::single); });
    }

private:
    using Body = std::function<void(PostgresConnection &)>;
    enum class Mode { write, read, single };

    template <class Work, class Run> static auto withResult(Work &work, Run run)
    {
        using Result = std::invoke_result_t<Work, PostgresConnection &>;
        if constexpr (std::is_void_v<Result>) {
            run(Body(work));
        } else {
            std::optional<Result> result;
            run([&](PostgresConnection &db) { result.emplace(work(db)); });
            return std::move(*result);
        }
    }

    /// A session for the caller alone; given back with `giveBack`.
    std::unique_ptr<PostgresConnection> borrow();
    void giveBack(std::unique_ptr<PostgresConnection> connection, bool sound);
    std::unique_ptr<PostgresConnection> open();

    void transact(const Body &body, Mode mode);
    void attempt(const Body &body, Mode mode);
    /// By what a transaction is found again from another session.
    struct Mark {
        std::string transaction;
        /// The database's start: another one, or one that came back after a crash, gives the same
        /// numbers to other transactions.
        std::string start;
    };
    static Mark begin(PostgresConnection &db);
    void commit(std::unique_ptr<PostgresConnection> &db, const Mark &mark);
    /// Whether a transaction whose commit was not answered has happened. Throws when nobody knows.
    bool hasCommitted(const Mark &mark);

    const std::string m_url;
    std::mutex m_mutex;
    std::condition_variable m_returned;
    std::vector<std::unique_ptr<PostgresConnection>> m_idle;
    std::size_t m_free;
    BackOff m_backOff{std::chrono::milliseconds(100)};
};

} // namespace pelliko::server
