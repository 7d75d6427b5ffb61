#include "tus/Checkpoints.h"

#include "http/Errors.h"

#include <boost/asio/as_tuple.hpp>
#include <boost/asio/co_spawn.hpp>
#include <boost/asio/steady_timer.hpp>
#include <boost/asio/this_coro.hpp>
#include <boost/asio/use_awaitable.hpp>

#include <algorithm>
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

void noteOffset(Metadata &metadata, const ActiveWrite &write, std::uint64_t upTo)
{
    if (metadata.recordOffset(write.key, upTo, write.right))
        return;
    if (metadata.recordOffset(write.key, 0))
        throw Refusal(Error::conflict, "Another request has taken over this upload.");
    throw Refusal(Error::gone);
}

} // namespace

struct Checkpoints::Running {
    explicit Running(const asio::any_io_executor &executor)
        : done(executor, asio::steady_timer::time_point::max())
    {
    }

    /// Never expires: cancelled to wake who waits for the end.
    asio::steady_timer done;
    bool ended = false;
    std::uint64_t notedUpTo = 0;
    std::exception_ptr error;
};

Task<void> checkpoint(Context &context, std::shared_ptr<ActiveWrite> write)
{
    if (!write->writer)
        co_return;
    const std::uint64_t upTo = write->kept = write->written;
    co_await context.blobPool.run([&] {
        if (upTo == write->size)
            write->writer->finish();
        else
            write->writer->sync();
    });
    co_await context.pool.run([&] { noteOffset(context.metadata, *write, upTo); });
}

/// A checkpoint while more is coming: as far as the store has got by itself.
Task<void> Checkpoints::note(std::shared_ptr<Running> running)
{
    const std::shared_ptr<ActiveWrite> write = m_write;
    const std::uint64_t written = write->written;
    running->notedUpTo =
        co_await m_context.blobPool.run([&] { return write->writer->settle(written); });
    // The whole file is noted only when its blob is whole.
    if (running->notedUpTo <= write->kept || running->notedUpTo >= write->size)
        co_return;
    write->kept = running->notedUpTo;
    co_await m_context.pool.run(
        [&] { noteOffset(m_context.metadata, *write, running->notedUpTo); });
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
    asio::co_spawn(executor, note(m_running), [running = m_running](std::exception_ptr error) {
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
    m_notedUpTo = std::max(m_notedUpTo, running->notedUpTo);
}

} // namespace pelliko::server
