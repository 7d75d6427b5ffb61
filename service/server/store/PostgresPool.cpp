#include "store/PostgresPool.h"

#include <thread>
#include <utility>

namespace pelliko::server
{
namespace
{

using namespace std::chrono_literals;
using Kind = StorageFailure::Kind;
using Remedy = PostgresFailure::Remedy;

/// How long a call waits for a session that others have.
constexpr auto patience = 15s;
/// More in a row is no chance any more.
constexpr int mostAttempts = 5;

PostgresFailure unavailable(const char *what)
{
    return {Kind::unavailable, Remedy::none, what};
}

} // namespace

PostgresPool::PostgresPool(std::string url, std::size_t connections)
    : m_url(std::move(url)), m_free(connections)
{
}

std::unique_ptr<PostgresConnection> PostgresPool::open()
{
    if (!m_backOff.mayTry())
        throw unavailable("metadata: the database could not be reached a moment ago");
    try {
        auto connection = std::make_unique<PostgresConnection>(m_url);
        m_backOff.reached();
        return connection;
    } catch (const PostgresFailure &) {
        m_backOff.missed();
        throw;
    }
}

std::unique_ptr<PostgresConnection> PostgresPool::borrow()
{
    {
        std::unique_lock lock(m_mutex);
        if (!m_returned.wait_for(lock, patience, [&] { return m_free > 0; }))
            throw unavailable("metadata: all sessions of the database are taken");
        --m_free;
        if (!m_idle.empty()) {
            auto connection = std::move(m_idle.back());
            m_idle.pop_back();
            return connection;
        }
    }
    try {
        return open();
    } catch (...) {
        giveBack(nullptr, true);
        throw;
    }
}

void PostgresPool::giveBack(std::unique_ptr<PostgresConnection> connection, bool sound)
{
    std::vector<std::unique_ptr<PostgresConnection>> ended;
    {
        const std::lock_guard lock(m_mutex);
        ++m_free;
        if (connection && sound)
            m_idle.push_back(std::move(connection));
        // What ended one session has most likely ended the others.
        if (!sound)
            ended.swap(m_idle);
    }
    m_returned.notify_one();
}

PostgresPool::Mark PostgresPool::begin(PostgresConnection &db)
{
    PostgresRows row =
        db.command("BEGIN ISOLATION LEVEL READ COMMITTED; SELECT pg_current_xact_id(),"
                   " extract(epoch FROM pg_postmaster_start_time())");
    if (!row.next())
        return {};
    return {row.text(0), row.text(1)};
}

bool PostgresPool::hasCommitted(const Mark &mark)
{
    // A session that is about to end still commits what it was told to: a moment is given to it.
    constexpr int mostLooks = 50;
    for (int look = 0; look < mostLooks; ++look) {
        auto db = borrow();
        std::string status;
        try {
            PostgresRows row =
                db->query("SELECT CASE extract(epoch FROM pg_postmaster_start_time())::text WHEN $3"
                          " THEN coalesce(pg_xact_status($1::text::xid8), '') ELSE 'elsewhere' END"
                          " FROM pg_sleep(CASE WHEN $2 > 0 THEN 0.1 ELSE 0 END)",
                          mark.transaction, look, mark.start);
            status = row.next() ? row.text(0) : std::string();
        } catch (...) {
            giveBack(std::move(db), false);
            throw;
        }
        giveBack(std::move(db), true);
        if (status == "elsewhere")
            throw unavailable("metadata: another database has taken over in mid-transaction");
        if (status != "in progress")
            return status == "committed";
    }
    throw unavailable("metadata: the database does not tell whether a transaction has happened");
}

void PostgresPool::commit(std::unique_ptr<PostgresConnection> &db, const Mark &mark)
{
    try {
        db->command("COMMIT");
    } catch (const PostgresFailure &failure) {
        if (failure.remedy() != Remedy::reconnect)
            throw;
        giveBack(std::exchange(db, nullptr), false);
        if (!hasCommitted(mark))
            throw;
    }
}

void PostgresPool::attempt(const Body &body, Mode mode)
{
    auto db = borrow();
    try {
        Mark mark;
        if (mode == Mode::write)
            mark = begin(*db);
        else if (mode == Mode::read)
            db->command("BEGIN ISOLATION LEVEL REPEATABLE READ READ ONLY");
        body(*db);
        if (mode == Mode::write)
            commit(db, mark);
        else if (mode == Mode::read)
            db->command("COMMIT");
    } catch (...) {
        bool sound = db && db->isAlive();
        if (sound && mode != Mode::single) {
            try {
                db->command("ROLLBACK");
            } catch (const PostgresFailure &) {
                sound = false;
            }
        }
        if (db)
            giveBack(std::move(db), sound);
        throw;
    }
    if (db)
        giveBack(std::move(db), true);
}

void PostgresPool::transact(const Body &body, Mode mode)
{
    for (int count = 1;; ++count) {
        try {
            attempt(body, mode);
            return;
        } catch (const PostgresFailure &failure) {
            if (failure.remedy() == Remedy::none || count == mostAttempts)
                throw;
        }
    }
}

} // namespace pelliko::server
