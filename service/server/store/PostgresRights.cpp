#include "store/PostgresRights.h"

#include "store/PostgresLayout.h"

#include <algorithm>
#include <utility>

namespace pelliko::server
{
namespace
{

using namespace std::chrono_literals;

/// A holder that was asked lets go as soon as what it has is on the disk. One that does not in this
/// time is stuck, or died without its machine telling; with what a claim needs beside it a new
/// writer is at work within five seconds.
constexpr auto holdersPatience = 3s;

} // namespace

PostgresRights::PostgresRights(PostgresConnection &db) : m_db(db)
{
    PostgresRows row = m_db.query("SELECT nextval('writers')");
    m_number = row.next() ? row.integer(0) : 0;
}

void PostgresRights::tell(const char *word, std::int64_t id)
{
    m_db.query("SELECT pg_notify('" PELLIKO_CHANNEL "', $1)",
               std::string(word) + " " + std::to_string(id));
}

/// In one statement, since each is a round trip of the one session that all uploads of a server
/// share. The number in the row is what counts: whoever wrote the blob before notes no offset any
/// more.
PostgresRights::Try PostgresRights::tryTake(const std::string &blob)
{
    try {
        PostgresRows row = m_db.query(
            "WITH wanted AS MATERIALIZED"
            " (SELECT id, pg_try_advisory_lock(id) AS ours FROM blobs WHERE key = $1),"
            " taken AS (UPDATE blobs b SET writer = $2 FROM wanted w WHERE b.id = w.id AND w.ours"
            " RETURNING b.id, b.received, b.doomed)"
            " SELECT w.id, w.ours, t.received, coalesce(t.doomed, true)"
            " FROM wanted w LEFT JOIN taken t USING (id)",
            blob, m_number);
        if (!row.next())
            return {};
        Try result{row.integer(0), row.integer(1) != 0};
        if (row.integer(3) == 0)
            result.noted = row.size(2);
        return result;
    } catch (const StorageFailure &) {
        letGo(blob);
        throw;
    }
}

/// With a full disk as much as this is still possible: nobody is to wait for one who does not
/// write. A session that is lost has no locks.
void PostgresRights::letGo(const std::string &blob)
{
    if (m_db.isAlive())
        m_db.query("SELECT pg_advisory_unlock(id) FROM blobs WHERE key = $1", blob);
}

void PostgresRights::unlock(std::int64_t id)
{
    m_db.query("SELECT pg_advisory_unlock($1)", id);
}

void PostgresRights::hold(const std::string &blob, const Try &taken, const Peers::ClaimDone &done)
{
    m_held[blob] = taken.id;
    m_keys[taken.id] = blob;
    done({m_number, nullptr, taken.noted});
}

void PostgresRights::claim(const std::string &blob, Peers::ClaimDone done)
{
    Try result;
    try {
        result = tryTake(blob);
        if (!result.isOurs)
            tell("stop", result.id);
    } catch (const StorageFailure &) {
        done({0, std::current_exception()});
        throw;
    }
    if (result.isOurs) {
        hold(blob, result, done);
        return;
    }
    m_waiting.push_back({blob, result.id, Clock::now() + holdersPatience, std::move(done)});
}

void PostgresRights::release(const std::string &blob)
{
    const auto held = m_held.find(blob);
    if (held == m_held.end())
        return;
    const std::int64_t id = held->second;
    m_held.erase(held);
    m_keys.erase(id);
    // False for one that was taken from a stuck holder, whose lock it still is.
    unlock(id);
    if (m_wanted.erase(id) != 0)
        tell("free", id);
}

void PostgresRights::freed(std::int64_t id)
{
    for (auto at = m_waiting.begin(); at != m_waiting.end();) {
        const auto each = at++;
        if (each->id != id)
            continue;
        Try result;
        try {
            result = tryTake(each->blob);
        } catch (const StorageFailure &) {
            const Waiting waiting = std::move(*each);
            m_waiting.erase(each);
            waiting.done({0, std::current_exception()});
            throw;
        }
        if (!result.isOurs) {
            // Somebody else was faster and knows nothing of this one yet.
            tell("stop", id);
            each->until = Clock::now() + holdersPatience;
            m_waiting.splice(m_waiting.end(), m_waiting, each);
            return;
        }
        const Waiting waiting = std::move(*each);
        m_waiting.erase(each);
        hold(waiting.blob, result, waiting.done);
    }
}

std::optional<std::string> PostgresRights::wanted(std::int64_t id)
{
    const auto key = m_keys.find(id);
    if (key == m_keys.end())
        return std::nullopt;
    m_wanted.insert(id);
    return key->second;
}

std::optional<PostgresRights::Clock::time_point> PostgresRights::nextTakeOver() const
{
    if (m_waiting.empty())
        return std::nullopt;
    return m_waiting.front().until;
}

void PostgresRights::takeOver()
{
    while (!m_waiting.empty() && m_waiting.front().until <= Clock::now()) {
        const Waiting waiting = std::move(m_waiting.front());
        m_waiting.pop_front();
        Try result;
        try {
            // Gets the lock of a holder that has died meanwhile; from one that is stuck only the
            // blob itself.
            result = tryTake(waiting.blob);
            if (!result.isOurs)
                m_db.query("UPDATE blobs SET writer = $2 WHERE id = $1", result.id, m_number);
        } catch (const StorageFailure &) {
            waiting.done({0, std::current_exception()});
            throw;
        }
        hold(waiting.blob, result, waiting.done);
    }
}

void PostgresRights::fail(const std::exception_ptr &error)
{
    for (const Waiting &waiting : std::exchange(m_waiting, {}))
        waiting.done({0, error});
}

} // namespace pelliko::server
