#include "push/EventStream.h"

#include "accounts/Accounts.h"
#include "http/Errors.h"
#include "push/PushHub.h"
#include "push/PushJson.h"
#include "store/StorageFailure.h"

#include <cstdint>
#include <optional>
#include <string>
#include <utility>

namespace pelliko::server
{
namespace
{

constexpr std::size_t ackLimit = 4096;
constexpr const char *secondsWhenBusy = "60";
constexpr const char *signOfLife = ":\n\n";

std::int64_t lastEventIdOf(const Request &request)
{
    const std::string *value = request.header("Last-Event-ID");
    if (value == nullptr || value->empty())
        return 0;
    const auto id = parsePushId(*value);
    if (!id)
        throw Refusal(Error::badRequest, "Last-Event-ID has to be the id of a push.");
    return *id;
}

/// Wakes the stream when its reader leaves, and no more once the stream is over.
class PeerWatch
{
public:
    PeerWatch(Exchange &exchange, PushHub::Seat &seat) : m_exchange(exchange)
    {
        m_exchange.watchPeer([&seat] { seat.end(); });
    }
    ~PeerWatch() { m_exchange.watchPeer({}); }
    PeerWatch(const PeerWatch &) = delete;
    PeerWatch &operator=(const PeerWatch &) = delete;

private:
    Exchange &m_exchange;
};

/// Sends what waits after `last` and moves it on; false when the token is no account's any more.
Task<bool> sendWaiting(Exchange &exchange, Context &context, const std::string &tokenHash,
                       std::int64_t &last)
{
    while (true) {
        const Seconds now = context.now();
        const auto pushes = co_await context.pool.run(
            [&] { return context.metadata.waitingPushes(tokenHash, last, now); });
        if (!pushes)
            co_return false;
        if (pushes->empty())
            co_return true;
        const std::string events = eventsOf(*pushes);
        co_await exchange.write(events);
        last = pushes->back().id;
    }
}

enum class Look { done, tokenEnded, storeAway };

/// A store that cannot be reached for a moment ends no stream: what waits is in it all the same.
Task<Look> look(Exchange &exchange, Context &context, const std::string &tokenHash,
                std::int64_t &last)
{
    try {
        const bool valid = co_await sendWaiting(exchange, context, tokenHash, last);
        co_return valid ? Look::done : Look::tokenEnded;
    } catch (const StorageFailure &failure) {
        if (failure.kind() != StorageFailure::Kind::unavailable)
            throw;
    }
    co_return Look::storeAway;
}

Task<void> serveSeat(Exchange &exchange, Context &context, PushHub::Seat &seat,
                     std::string tokenHash, std::int64_t last)
{
    bool lookAgain = false;
    while (true) {
        const PushHub::Wake wake = co_await seat.wait();
        if (wake.ended)
            co_return;
        if (wake.look || lookAgain) {
            const Look result = co_await look(exchange, context, tokenHash, last);
            if (result == Look::tokenEnded)
                co_return;
            lookAgain = result == Look::storeAway;
        }
        if (wake.beat)
            co_await exchange.write(signOfLife);
    }
}

Response streamHead()
{
    // Proxies like nginx collect answers unless they are told not to.
    return makeResponse(Status::ok, {{"Content-Type", "text/event-stream"},
                                     {"Cache-Control", "no-store"},
                                     {"X-Accel-Buffering", "no"}});
}

} // namespace

Task<void> streamPushes(Exchange &exchange, Context &context)
{
    const Account account = co_await authenticate(exchange, context);
    const std::int64_t last = lastEventIdOf(exchange.request());
    if (exchange.request().method != "HEAD") {
        if (context.pushes.full())
            throw Refusal(Error::busy, {}, {{"Retry-After", secondsWhenBusy}});
        // Taken before the first look, so that nothing is made unseen in between.
        PushHub::Seat seat(context.pushes, account.id);
        co_await exchange.startStream(streamHead(), std::nullopt);
        const PeerWatch watch(exchange, seat);
        co_await serveSeat(exchange, context, seat, tokenHashOf(exchange.request()), last);
    } else {
        co_await exchange.startStream(streamHead(), std::nullopt);
    }
    co_await exchange.endStream();
}

Task<void> acknowledgePushes(Exchange &exchange, Context &context)
{
    const Account account = co_await authenticate(exchange, context);
    const std::string body = co_await readWholeBody(exchange, ackLimit);
    const std::int64_t upTo = parseAcknowledged(body);
    const bool known = co_await context.pool.run(
        [&] { return context.metadata.acknowledgePushes(account.id, upTo); });
    if (!known)
        throw Refusal(Error::conflict, "No push has had this id.");
    co_await exchange.respond(makeResponse(Status::noContent));
}

} // namespace pelliko::server
