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

/// A crash loses what a running checkpoint covers and what arrived since it began. Pieces of up to
/// a MiB may go beyond each, so that these are 16 MiB at most.
constexpr std::uint64_t checkpointEvery = 7 * 1024 * 1024;

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
    const bool wanted = co_await context.pool.run([&] {
        write->writer->sync();
        return context.metadata.recordOffset(write->key, upTo);
    });
    if (!wanted)
        throw Refusal(Error::gone);
}

Checkpoints::Checkpoints(Context &context, std::shared_ptr<ActiveWrite> write)
    : m_context(context), m_write(std::move(write)), m_begunUpTo(m_write->written)
{
}

Task<void> Checkpoints::advance()
{
    if (m_write->written - m_begunUpTo < checkpointEvery)
        co_return;
    co_await finish();
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
}

} // namespace pelliko::server
