#pragma once

#include "http/Exchange.h"

#include <boost/asio/any_io_executor.hpp>
#include <boost/asio/as_tuple.hpp>
#include <boost/asio/steady_timer.hpp>
#include <boost/asio/use_awaitable.hpp>

#include <chrono>

namespace pelliko::server
{

/// A deadline that is moved often and rarely comes: arming costs no timer unless the deadline is
/// earlier than the one slept for.
class Watchdog
{
public:
    using Clock = std::chrono::steady_clock;

    explicit Watchdog(const boost::asio::any_io_executor &executor)
        : m_timer(executor, Clock::time_point::max())
    {
    }

    void arm(std::chrono::seconds wait)
    {
        m_deadline = Clock::now() + wait;
        if (m_deadline < m_timer.expiry())
            m_timer.cancel();
    }
    void disarm() { m_deadline = Clock::time_point::max(); }

    /// Ends the wait of `expired` with false.
    void stop()
    {
        m_stopped = true;
        m_timer.cancel();
    }

    /// Waits until an armed deadline has come (true) or the watchdog was stopped (false).
    Task<bool> expired()
    {
        while (!m_stopped) {
            if (Clock::now() >= m_deadline)
                co_return true;
            m_timer.expires_at(m_deadline);
            co_await m_timer.async_wait(boost::asio::as_tuple(boost::asio::use_awaitable));
        }
        co_return false;
    }

private:
    boost::asio::steady_timer m_timer;
    Clock::time_point m_deadline = Clock::time_point::max();
    bool m_stopped = false;
};

} // namespace pelliko::server
