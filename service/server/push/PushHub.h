// Who listens for pushes, and who has to look for one
#pragma once

#include "http/Exchange.h"
#include "shares/Limits.h"

#include <boost/asio/any_io_executor.hpp>
#include <boost/asio/steady_timer.hpp>

#include <cstdint>
#include <list>
#include <unordered_map>
#include <vector>

namespace pelliko::server
{

/// The open streams of this server by account. It holds no pushes: a stream that is woken reads
/// the store, so that a slow one costs no memory, and whatever tells of a push, another server
/// included, only has to name the account. One timer beats for all streams. Network thread only.
class PushHub
{
public:
    /// With `looksByTime` streams look now and then although nothing was announced.
    PushHub(const boost::asio::any_io_executor &executor, const Limits &limits, bool looksByTime);

    /// What a stream was woken for. The first wake of a stream has `look`.
    struct Wake {
        /// There may be a push, or the account's token may have ended.
        bool look = false;
        /// Time for a sign of life.
        bool beat = false;
        bool ended = false;
    };

    /// One stream's place, from its making on: what is announced later wakes it.
    class Seat
    {
    public:
        /// Ends the account's oldest stream when it has as many as it may.
        Seat(PushHub &hub, std::int64_t account);
        ~Seat();
        Seat(const Seat &) = delete;
        Seat &operator=(const Seat &) = delete;

        /// Waits until there is something; returns all that came since the last call.
        Task<Wake> wait();
        /// Wakes the stream for the last time.
        void end();

    private:
        friend class PushHub;
        void look();
        void beat();

        PushHub &m_hub;
        std::int64_t m_account;
        std::list<Seat *>::iterator m_place;
        boost::asio::steady_timer m_timer;
        Wake m_wake{true, false, false};
    };

    /// True when there is no room for another stream.
    [[nodiscard]] bool full() const { return m_count >= m_streams; }

    [[nodiscard]] std::size_t count() const { return m_count; }

    /// These accounts' streams have to look.
    void announce(const std::vector<std::int64_t> &accounts);
    /// All streams have to look.
    void announceAll();

    /// Beats until stopped.
    Task<void> run();
    /// Ends all streams, and those that come.
    void stop();

private:
    void take(Seat &seat);
    void leave(Seat &seat);
    void beatAll(bool look);

    boost::asio::steady_timer m_timer;
    std::unordered_map<std::int64_t, std::list<Seat *>> m_seats;
    std::size_t m_count = 0;
    std::size_t m_streams;
    std::size_t m_streamsPerAccount;
    std::chrono::seconds m_keepAlive;
    bool m_looksByTime;
    bool m_stopped = false;
};

} // namespace pelliko::server
