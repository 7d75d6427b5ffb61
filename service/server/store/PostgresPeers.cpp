#include "store/PostgresPeers.h"

#include "store/PostgresClock.h"
#include "store/PostgresLayout.h"
#include "store/PostgresRights.h"
#include "store/PostgresTables.h"

#include <libpq-fe.h>
#include <poll.h>
#include <sys/eventfd.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <charconv>
#include <chrono>
#include <cstdio>
#include <deque>
#include <mutex>
#include <optional>
#include <string_view>
#include <thread>
#include <utility>

namespace pelliko::server
{
namespace
{

using namespace std::chrono_literals;
using Clock = PostgresRights::Clock;
using Kind = StorageFailure::Kind;
using Remedy = PostgresFailure::Remedy;

constexpr auto firstBackOff = 100ms;
constexpr auto longestBackOff = 2s;
/// Counters of machines differ by some seconds a day.
constexpr auto clockRound = 60s;

/// How often a server asks for the sweeper's lock. It does not wait for it in the database: a
/// statement that waits keeps every row from being cleaned up that was deleted meanwhile.
constexpr auto electionRound = 1s;

struct Order {
    enum class Kind { claim, release, sweep };
    Kind kind;
    std::string blob;
    Peers::ClaimDone done;
};

std::vector<std::int64_t> numbersOf(std::string_view text)
{
    std::vector<std::int64_t> numbers;
    while (!text.empty()) {
        std::int64_t number = 0;
        const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
        if (error != std::errc())
            break;
        numbers.push_back(number);
        text.remove_prefix(static_cast<std::size_t>(end - text.data()));
        text.remove_prefix(std::min<std::size_t>(1, text.size()));
    }
    return numbers;
}

} // namespace

class PostgresPeers::Thread
{
public:
    Thread(std::string url, std::shared_ptr<PostgresClock> clock)
        : m_url(std::move(url)), m_clock(std::move(clock)),
          m_wake(eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK))
    {
    }
    ~Thread() { ::close(m_wake); }
    Thread(const Thread &) = delete;
    Thread &operator=(const Thread &) = delete;

    void start(Ears ears)
    {
        m_ears = std::move(ears);
        m_thread = std::thread([this] { run(); });
    }

    void stop()
    {
        m_stopping = true;
        wake();
        if (m_thread.joinable())
            m_thread.join();
    }

    void give(Order order)
    {
        {
            const std::lock_guard lock(m_mutex);
            m_orders.push_back(std::move(order));
        }
        wake();
    }

    [[nodiscard]] bool sweeps() const { return m_sweeps; }
    void sweepHere() const { m_ears.sweep(); }

private:
    void run();
    void work();
    void connect();
    void lose(const std::exception_ptr &error);
    void follow(Order &order);
    std::optional<Order> nextOrder();
    void followOrders();
    void refuseOrders(const std::exception_ptr &error);
    void hearAll();
    void hear(std::string_view message);
    void takePartInElection();
    void await();
    [[nodiscard]] int patience() const;
    void wake() const;

    const std::string m_url;
    const std::shared_ptr<PostgresClock> m_clock;
    const int m_wake;
    Ears m_ears;
    std::thread m_thread;
    std::atomic<bool> m_stopping{false};
    std::atomic<bool> m_sweeps{false};

    std::mutex m_mutex;
    std::deque<Order> m_orders;

    // Of the thread alone.
    std::unique_ptr<PostgresConnection> m_session;
    std::unique_ptr<PostgresRights> m_rights;
    Clock::time_point m_notBefore{};
    Clock::duration m_backOff{};
    Clock::time_point m_nextClock{};
    Clock::time_point m_nextElection{};
};

void PostgresPeers::Thread::wake() const
{
    const std::uint64_t one = 1;
    [[maybe_unused]] const ssize_t written = ::write(m_wake, &one, sizeof one);
}

void PostgresPeers::Thread::run()
{
    while (!m_stopping) {
        try {
            work();
        } catch (const StorageFailure &error) {
            std::fprintf(stderr, "pelliko-server: among servers: %s\n", error.what());
            // What one statement was refused for does not end the others' rights.
            if (!m_session || !m_session->isAlive())
                lose(std::current_exception());
            // Others' orders may still wait.
            continue;
        }
        await();
    }
    const auto stopping = std::make_exception_ptr(
        PostgresFailure(Kind::unavailable, Remedy::none, "the server is stopping"));
    refuseOrders(stopping);
    lose(stopping);
}

void PostgresPeers::Thread::work()
{
    if (!m_session) {
        // Whoever claims meanwhile waits for the next attempt.
        if (Clock::now() < m_notBefore)
            return;
        try {
            connect();
        } catch (const StorageFailure &) {
            refuseOrders(std::current_exception());
            throw;
        }
    }
    followOrders();
    if (Clock::now() >= m_nextClock) {
        m_nextClock = Clock::now() + clockRound;
        m_clock->set(*m_session);
    }
    m_rights->takeOver();
    hearAll();
    takePartInElection();
}

void PostgresPeers::Thread::connect()
{
    auto session = std::make_unique<PostgresConnection>(m_url);
    // Who writes a blob is forgotten with the sessions when the database falls.
    session->command(
        "SET synchronous_commit = off; SET lock_timeout = '2s'; LISTEN " PELLIKO_CHANNEL);
    // Ends with the session, so that it is known as long as this server runs.
    if (!takePartInServing(*session))
        throw PostgresFailure(Kind::unavailable, Remedy::none, "the data are being moved");
    m_rights = std::make_unique<PostgresRights>(*session);
    m_session = std::move(session);
    m_nextClock = m_nextElection = {};
    m_backOff = {};
    // What was told meanwhile was told to nobody here.
    m_ears.missed();
}

void PostgresPeers::Thread::lose(const std::exception_ptr &error)
{
    m_sweeps = false;
    m_backOff = std::clamp<Clock::duration>(2 * m_backOff, firstBackOff, longestBackOff);
    m_notBefore = Clock::now() + m_backOff;
    if (m_rights) {
        m_rights->fail(error);
        m_ears.stopAllWriting();
    }
    m_rights.reset();
    m_session.reset();
}

std::optional<Order> PostgresPeers::Thread::nextOrder()
{
    const std::lock_guard lock(m_mutex);
    if (m_orders.empty())
        return std::nullopt;
    std::optional<Order> order(std::move(m_orders.front()));
    m_orders.pop_front();
    return order;
}

void PostgresPeers::Thread::followOrders()
{
    while (auto order = nextOrder())
        follow(*order);
}

void PostgresPeers::Thread::refuseOrders(const std::exception_ptr &error)
{
    while (const auto order = nextOrder()) {
        if (order->kind == Order::Kind::claim)
            order->done({0, error});
    }
}

void PostgresPeers::Thread::follow(Order &order)
{
    switch (order.kind) {
    case Order::Kind::claim:
        m_rights->claim(order.blob, std::move(order.done));
        return;
    case Order::Kind::release:
        m_rights->release(order.blob);
        return;
    case Order::Kind::sweep:
        m_session->command("NOTIFY " PELLIKO_CHANNEL ", 'sweep'");
        return;
    }
}

void PostgresPeers::Thread::hearAll()
{
    if (PQconsumeInput(m_session->get()) == 0)
        throw PostgresFailure(Kind::unavailable, Remedy::reconnect,
                              "the database ended the connection");
    while (PGnotify *notification = PQnotifies(m_session->get())) {
        const std::unique_ptr<PGnotify, decltype(&PQfreemem)> owner(notification, PQfreemem);
        hear(notification->extra);
    }
}

void PostgresPeers::Thread::hear(std::string_view message)
{
    const std::string_view word = message.substr(0, message.find(' '));
    message.remove_prefix(std::min(word.size() + 1, message.size()));
    const std::vector<std::int64_t> numbers = numbersOf(message);
    if (word == "push")
        m_ears.pushes(numbers);
    else if (word == "sweep" && m_sweeps)
        m_ears.sweep();
    for (const std::int64_t id : numbers) {
        if (word == "free")
            m_rights->freed(id);
        const auto blob = word == "stop" ? m_rights->wanted(id) : std::nullopt;
        if (blob)
            m_ears.stopWriting(*blob);
    }
}

/// The lock ends with the session of the server that has swept until now.
void PostgresPeers::Thread::takePartInElection()
{
    if (m_sweeps || Clock::now() < m_nextElection)
        return;
    m_nextElection = Clock::now() + electionRound;
    PostgresRows row = m_session->query(
        "SELECT pg_try_advisory_lock($1::bigint::int, $2::bigint::int)", lockGroup, lockOfSweeper);
    m_sweeps = row.next() && row.integer(0) != 0;
    if (m_sweeps)
        m_ears.sweep();
}

int PostgresPeers::Thread::patience() const
{
    Clock::time_point until = m_session ? m_nextClock : m_notBefore;
    if (m_session && !m_sweeps)
        until = std::min(until, m_nextElection);
    const auto next = m_rights ? m_rights->nextTakeOver() : std::nullopt;
    until = std::min(until, next.value_or(until));
    const auto rest = std::chrono::ceil<std::chrono::milliseconds>(until - Clock::now());
    return static_cast<int>(std::clamp<std::int64_t>(rest.count(), 0, 60'000));
}

void PostgresPeers::Thread::await()
{
    std::array<pollfd, 2> waits{pollfd{m_wake, POLLIN, 0}, pollfd{-1, POLLIN, 0}};
    if (m_session)
        waits[1].fd = PQsocket(m_session->get());
    if (m_stopping || ::poll(waits.data(), waits.size(), patience()) <= 0)
        return;
    std::uint64_t count = 0;
    [[maybe_unused]] const ssize_t got = ::read(m_wake, &count, sizeof count);
}

PostgresPeers::PostgresPeers(const std::string &url, std::shared_ptr<PostgresClock> clock)
    : m_thread(std::make_unique<Thread>(url, std::move(clock)))
{
}

PostgresPeers::~PostgresPeers()
{
    m_thread->stop();
}

void PostgresPeers::listen(Ears ears)
{
    m_thread->start(std::move(ears));
}

void PostgresPeers::close()
{
    m_thread->stop();
}

void PostgresPeers::claim(const std::string &blob, ClaimDone done)
{
    m_thread->give({Order::Kind::claim, blob, std::move(done)});
}

void PostgresPeers::release(const std::string &blob) noexcept
{
    try {
        m_thread->give({Order::Kind::release, blob, {}});
    } catch (const std::exception &) {
        // Without memory for a message the right ends with this server.
    }
}

bool PostgresPeers::sweeps() const
{
    return m_thread->sweeps();
}

void PostgresPeers::wakeSweeper()
{
    if (sweeps())
        m_thread->sweepHere();
    else
        m_thread->give({Order::Kind::sweep, {}, {}});
}

} // namespace pelliko::server
