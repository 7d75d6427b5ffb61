#include "tus/Checkpoints.h"

#include "http/Errors.h"

#include <boost/asio/as_tuple.hpp>
#include <boost/asio/co_spawn.hpp>
#include <boost/asio/steady_timer.hpp>
#include <boost/asio/this_coro.hpp>
#include <boost/asio/use_awaitable.hpp>

#include <exception>
#include <utility>

namespace pelliko::server
{
namespace
{

namespace asio = boost::asio;

/// Less is not worth a wait for the disk.
constexpr std::uint64_t leastStep = 8 * 1024 * 1024;
/// What may be stored and not be noted, and is lost in a crash, where the disk is slower than the
/// network; a piece of up to a MiB may come on top.
constexpr std::uint64_t mostUnnoted = 63 * 1024 * 1024;

} // namespace

struct Checkpoints::Running {
    explicit Running(const asio::any_io_executor &executor)
        : done(executor, asio::steady_timer::time_point::max())
    {
    }

    /// Never expires: cancelled to wake who waits for the end.
    asio::steady_timer done;
    bool ended = false;
    std::exception_ptr error;
};

Task<void> checkpoint(Context &context, std::shared_ptr<ActiveWrite> write)
{
    if (!write->writer)
        co_return;
    const std::uint64_t upTo = write->kept = write->written;
    bool wanted = true;
    const bool noted = co_await context.pool.run([&] {
        write->writer->sync();
        const bool done = context.metadata.recordOffset(write->key, upTo, write->right);
        wanted = done || context.metadata.recordOffset(write->key, 0);
        return done;
    });
    if (!noted && wanted)
        throw Refusal(Error::conflict, "Another request has taken over this upload.");
    if (!noted)
        throw Refusal(Error::gone);
}

Checkpoints::Checkpoints(Context &context, std::shared_ptr<ActiveWrite> write)
    : m_context(context), m_write(std::move(write)), m_begunUpTo(m_write->written),
      m_notedUpTo(m_begunUpTo)
{
}

Task<void> Checkpoints::advance()
{
    const bool ended = m_running && m_running->ended;
    const bool tooFar = m_write->written - m_notedUpTo >= mostUnnoted;
    if (ended || tooFar)
        co_await finish();
    if (m_running || m_write->written - m_begunUpTo < leastStep)
        co_return;
    m_begunUpTo = m_write->written;
    const auto executor = co_await asio::this_coro::executor;
    m_running = std::make_shared<Running>(executor);
    asio::co_spawn(executor, checkpoint(m_context, m_write),
                   [running = m_running](std::exception_ptr error) {
                       running->error = std::move(error);
                       running->ended = true;
                       running->done.cancel();
                   });
}

Task<void> Checkpoints::finish()
{
    const std::shared_ptr<Running> running = std::exchange(m_running, nullptr);
    if (!running)
        co_return;
    while (!running->ended)
        co_await running->done.async_wait(asio::as_tuple(asio::use_awaitable));
    if (running->error)
        std::rethrow_exception(running->error);
    m_notedUpTo = m_begunUpTo;
}

} // namespace pelliko::server
