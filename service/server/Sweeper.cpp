#include "Sweeper.h"

#include <boost/asio/as_tuple.hpp>
#include <boost/asio/co_spawn.hpp>
#include <boost/asio/detached.hpp>
#include <boost/asio/steady_timer.hpp>
#include <boost/asio/use_awaitable.hpp>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <exception>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace pelliko::server
{

namespace asio = boost::asio;

namespace
{

/// After a failure of the store, which may pass.
constexpr std::chrono::seconds retryDelay{60};
/// While there is something that nobody but this server knows of.
constexpr std::chrono::seconds doubtDelay{10};
/// Of the calls that a store takes at once the sweeper uses one of so many.
constexpr std::size_t shareOfCalls = 6;
/// A store of millions is looked through in pieces.
constexpr std::size_t blobsAtOnce = 1000;

std::vector<std::string> keysOf(const std::vector<StoredBlob> &blobs)
{
    std::vector<std::string> keys;
    keys.reserve(blobs.size());
    for (const StoredBlob &blob : blobs)
        keys.push_back(blob.key);
    return keys;
}

} // namespace

/// Blobs of which several are being removed.
struct Sweeper::Removal {
    explicit Removal(const asio::any_io_executor &executor)
        : done(executor, asio::steady_timer::time_point::max())
    {
    }

    std::vector<std::string> keys;
    std::size_t next = 0;
    std::size_t atWork = 0;
    std::exception_ptr failure;
    /// Never expires: cancelled by whoever ends last.
    asio::steady_timer done;
};

Sweeper::Sweeper(const asio::any_io_executor &executor, Context &context)
    : m_context(context), m_timer(executor)
{
}

void Sweeper::wake()
{
    m_woken = true;
    m_timer.cancel();
}

void Sweeper::doubt(const std::string &blob)
{
    m_doubtful.insert(blob);
    wake();
}

void Sweeper::stop()
{
    m_stopped = true;
    m_timer.cancel();
}

Task<void> Sweeper::run()
{
    while (!m_stopped) {
        m_woken = false;
        bool failed = false;
        try {
            co_await round();
        } catch (const std::exception &error) {
            std::fprintf(stderr, "pelliko-server: sweeping: %s\n", error.what());
            failed = true;
        }
        if (failed && !m_stopped) {
            m_timer.expires_after(m_doubtful.empty() ? retryDelay : doubtDelay);
            co_await m_timer.async_wait(asio::as_tuple(asio::use_awaitable));
        }
    }
}

Task<void> Sweeper::round()
{
    co_await settleDoubts();
    if (!m_context.peers.sweeps()) {
        m_timer.expires_at(std::chrono::system_clock::time_point::max());
        if (!m_woken && !m_stopped)
            co_await m_timer.async_wait(asio::as_tuple(asio::use_awaitable));
        co_return;
    }
    if (!std::exchange(m_lookedForStrays, true)) {
        try {
            co_await removeStrays();
        } catch (const std::exception &error) {
            std::fprintf(stderr, "pelliko-server: looking for strays: %s\n", error.what());
        }
    }
    co_await sweep();
    co_await sleep();
}

/// A server that was cut off or stuck goes on writing for a while. When the blob's share has ended
/// meanwhile, the server that sweeps has removed what was there before, and the database knows
/// nothing of what came later.
Task<void> Sweeper::settleDoubts()
{
    while (!m_doubtful.empty() && !m_stopped) {
        // What is doubted meanwhile is doubted anew.
        const auto blob = m_doubtful.extract(m_doubtful.begin());
        try {
            const bool isWanted = co_await m_context.pool.run(
                [&] { return m_context.metadata.recordOffset(blob.value(), 0); });
            if (!isWanted)
                co_await m_context.blobPool.run([&] { m_context.blobs.remove(blob.value()); });
        } catch (const std::exception &) {
            m_doubtful.insert(blob.value());
            throw;
        }
    }
}

/// Bytes that the database does not know are needed by nobody: a copy of it that was put back may
/// be older than the blobs. A blob's key is in the database before there is a file, so uploads that
/// run meanwhile are safe. A database without accounts is rather one that still has to be put back.
Task<void> Sweeper::removeStrays()
{
    const bool isEmpty =
        co_await m_context.pool.run([&] { return !m_context.metadata.hasAccounts(); });
    std::size_t removed = 0;
    std::string last;
    while (!isEmpty && !m_stopped) {
        const std::vector<std::string> keys = co_await m_context.blobPool.run(
            [&] { return keysOf(m_context.blobs.list(last, blobsAtOnce)); });
        if (keys.empty())
            break;
        last = keys.back();
        const std::vector<std::string> unknown =
            co_await m_context.pool.run([&] { return m_context.metadata.unknownBlobs(keys); });
        co_await m_context.blobPool.run([&] {
            for (const std::string &key : unknown)
                m_context.blobs.remove(key);
        });
        removed += unknown.size();
        m_context.metrics.blobsRemoved(unknown.size());
    }
    if (removed > 0)
        std::fprintf(stderr, "pelliko-server: removed %zu stray blobs\n", removed);
}

Task<void> Sweeper::sweep()
{
    const Seconds now = m_context.now();
    const auto ended =
        co_await m_context.pool.run([&] { return m_context.metadata.expireShares(now); });
    for (const std::string &blob : ended)
        m_context.writes.stop(blob);
    const Limits &limits = m_context.limits;
    co_await m_context.pool.run([&] {
        m_context.metadata.forgetEnded(now - limits.endedKept, now - limits.dailyWindow);
        m_context.metadata.forgetInvitations(now - limits.endedKept);
    });
    co_await removeDoomed();
}

Task<void> Sweeper::removeOne(std::string key)
{
    // Under the lease nobody can make the blob again after it was removed.
    const ActiveWrites::Lease lease = co_await m_context.writes.take(key, [] {});
    co_await m_context.blobPool.run([&] { m_context.blobs.remove(key); });
    co_await m_context.pool.run([&] { m_context.metadata.forgetBlob(key); });
    m_context.metrics.blobsRemoved(1);
}

/// Removes one after the other, as others do with the same keys at the same time.
Task<void> Sweeper::removeInTurn(std::shared_ptr<Removal> removal)
{
    try {
        while (removal->next < removal->keys.size() && !removal->failure && !m_stopped) {
            std::string key = removal->keys[removal->next++];
            co_await removeOne(std::move(key));
        }
    } catch (const std::exception &) {
        removal->failure = std::current_exception();
    }
    if (--removal->atWork == 0)
        removal->done.cancel();
}

Task<void> Sweeper::removeDoomed()
{
    while (!m_stopped) {
        const auto removal = std::make_shared<Removal>(m_timer.get_executor());
        removal->keys =
            co_await m_context.pool.run([&] { return m_context.metadata.doomedBlobs(); });
        if (removal->keys.empty())
            co_return;
        // Most of a removal is waiting, and others want the store as well.
        const std::size_t atOnce =
            std::max<std::size_t>(1, m_context.blobs.callsAtOnce() / shareOfCalls);
        removal->atWork = atOnce;
        for (std::size_t count = 0; count < atOnce; ++count)
            asio::co_spawn(m_timer.get_executor(), removeInTurn(removal), asio::detached);
        if (removal->atWork > 0)
            co_await removal->done.async_wait(asio::as_tuple(asio::use_awaitable));
        if (removal->failure)
            std::rethrow_exception(removal->failure);
    }
}

Task<void> Sweeper::sleep()
{
    const Limits &limits = m_context.limits;
    const Seconds next = co_await m_context.pool.run([&] {
        // No deadline that is set from here on is earlier: nobody has to tell of new ones.
        Seconds earliest =
            m_context.now() + std::min(limits.shareLifetime, limits.unfinishedLifetime);
        if (const auto deadline = m_context.metadata.nextDeadline())
            earliest = std::min(earliest, *deadline);
        if (const auto ended = m_context.metadata.earliestEnd())
            earliest = std::min(earliest, *ended + limits.endedKept);
        return earliest;
    });
    // No suspension between this look and the wait: a wake in between cannot be lost.
    if (m_woken || m_stopped)
        co_return;
    m_timer.expires_after(std::chrono::seconds(next - m_context.now()));
    co_await m_timer.async_wait(asio::as_tuple(asio::use_awaitable));
}

} // namespace pelliko::server
