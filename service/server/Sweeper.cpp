#include "Sweeper.h"

#include <boost/asio/as_tuple.hpp>
#include <boost/asio/use_awaitable.hpp>

#include <chrono>
#include <cstdio>
#include <vector>

namespace pelliko::server
{
namespace
{

/// After a failure of the store, which may pass.
constexpr std::chrono::seconds retryDelay{60};

} // namespace

Sweeper::Sweeper(const boost::asio::any_io_executor &executor, Context &context)
    : m_context(context), m_timer(executor)
{
}

void Sweeper::wake()
{
    m_woken = true;
    m_timer.cancel();
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
            co_await sweep();
            co_await sleep();
        } catch (const std::exception &error) {
            std::fprintf(stderr, "pelliko-server: sweeping: %s\n", error.what());
            failed = true;
        }
        if (failed && !m_stopped) {
            m_timer.expires_after(retryDelay);
            co_await m_timer.async_wait(boost::asio::as_tuple(boost::asio::use_awaitable));
        }
    }
}

Task<void> Sweeper::sweep()
{
    const Seconds now = m_context.now();
    const auto ended =
        co_await m_context.pool.run([&] { return m_context.metadata.expireShares(now); });
    for (const std::string &blob : ended)
        m_context.writes.stop(blob);
    co_await removeDoomed();
}

Task<void> Sweeper::removeDoomed()
{
    while (!m_stopped) {
        const std::vector<std::string> keys =
            co_await m_context.pool.run([&] { return m_context.metadata.doomedBlobs(); });
        if (keys.empty())
            co_return;
        for (const std::string &key : keys) {
            // Under the lease nobody can make the blob again after it was removed.
            const ActiveWrites::Lease lease = co_await m_context.writes.take(key, [] {});
            co_await m_context.pool.run([&] {
                m_context.blobs.remove(key);
                m_context.metadata.forgetBlob(key);
            });
        }
    }
}

Task<void> Sweeper::sleep()
{
    const auto next =
        co_await m_context.pool.run([&] { return m_context.metadata.nextDeadline(); });
    // No suspension between this look and the wait: a wake in between cannot be lost.
    if (m_woken || m_stopped)
        co_return;
    if (next)
        m_timer.expires_after(std::chrono::seconds(*next - m_context.now()));
    else
        m_timer.expires_at(std::chrono::system_clock::time_point::max());
    co_await m_timer.async_wait(boost::asio::as_tuple(boost::asio::use_awaitable));
}

} // namespace pelliko::server
