#include "push/PushHub.h"

#include <boost/asio/as_tuple.hpp>
#include <boost/asio/use_awaitable.hpp>

#include <utility>

namespace pelliko::server
{
namespace
{

namespace asio = boost::asio;
constexpr auto asTuple = asio::as_tuple(asio::use_awaitable);
using Clock = asio::steady_timer::clock_type;

/// A stream whose account was removed by another process gets no push that would show it: where
/// nobody tells, its token is looked at again after so many beats, five minutes.
constexpr unsigned beatsPerLook = 12;

} // namespace

PushHub::Seat::Seat(PushHub &hub, std::int64_t account)
    : m_hub(hub), m_account(account), m_timer(hub.m_timer.get_executor(), Clock::time_point::max())
{
    m_hub.take(*this);
}

PushHub::Seat::~Seat()
{
    m_hub.leave(*this);
}

Task<PushHub::Wake> PushHub::Seat::wait()
{
    if (!m_wake.look && !m_wake.beat && !m_wake.ended)
        co_await m_timer.async_wait(asTuple);
    co_return std::exchange(m_wake, {});
}

void PushHub::Seat::end()
{
    m_wake.ended = true;
    m_timer.cancel();
}

void PushHub::Seat::look()
{
    m_wake.look = true;
    m_timer.cancel();
}

void PushHub::Seat::beat()
{
    m_wake.beat = true;
    m_timer.cancel();
}

PushHub::PushHub(const asio::any_io_executor &executor, const Limits &limits, bool looksByTime)
    : m_timer(executor), m_streams(limits.pushStreams),
      m_streamsPerAccount(limits.pushStreamsPerAccount), m_keepAlive(limits.pushKeepAlive),
      m_looksByTime(looksByTime)
{
}

void PushHub::take(Seat &seat)
{
    std::list<Seat *> &seats = m_seats[seat.m_account];
    // The oldest is the likeliest to be one whose reader is long gone.
    if (seats.size() >= m_streamsPerAccount)
        seats.front()->end();
    seat.m_place = seats.insert(seats.end(), &seat);
    if (++m_count == 1)
        m_timer.cancel();
    if (m_stopped)
        seat.end();
}

void PushHub::leave(Seat &seat)
{
    const auto seats = m_seats.find(seat.m_account);
    seats->second.erase(seat.m_place);
    if (seats->second.empty())
        m_seats.erase(seats);
    --m_count;
}

void PushHub::announce(const std::vector<std::int64_t> &accounts)
{
    for (std::int64_t account : accounts) {
        const auto seats = m_seats.find(account);
        if (seats == m_seats.end())
            continue;
        for (Seat *seat : seats->second)
            seat->look();
    }
}

void PushHub::announceAll()
{
    for (const auto &[account, seats] : m_seats) {
        for (Seat *seat : seats)
            seat->look();
    }
}

void PushHub::beatAll(bool look)
{
    for (const auto &[account, seats] : m_seats) {
        for (Seat *seat : seats) {
            seat->beat();
            if (look)
                seat->look();
        }
    }
}

Task<void> PushHub::run()
{
    unsigned beats = 0;
    while (!m_stopped) {
        m_timer.expires_at(m_count == 0 ? Clock::time_point::max() : Clock::now() + m_keepAlive);
        auto [cancelled] = co_await m_timer.async_wait(asTuple);
        if (!cancelled)
            beatAll(m_looksByTime && ++beats % beatsPerLook == 0);
    }
}

void PushHub::stop()
{
    m_stopped = true;
    m_timer.cancel();
    for (const auto &[account, seats] : m_seats) {
        for (Seat *seat : seats)
            seat->end();
    }
}

} // namespace pelliko::server
