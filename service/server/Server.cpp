#include "Server.h"

#include "Sweeper.h"
#include "http/Capacity.h"
#include "http/Connection.h"
#include "http/Router.h"

#include <boost/asio/as_tuple.hpp>
#include <boost/asio/co_spawn.hpp>
#include <boost/asio/detached.hpp>
#include <boost/asio/dispatch.hpp>
#include <boost/asio/io_context.hpp>
#include <boost/asio/ip/tcp.hpp>
#include <boost/asio/post.hpp>
#include <boost/asio/signal_set.hpp>
#include <boost/asio/steady_timer.hpp>
#include <boost/asio/use_awaitable.hpp>

#include <algorithm>
#include <chrono>
#include <csignal>
#include <cstdio>
#include <set>
#include <stdexcept>
#include <utility>

namespace pelliko::server
{
namespace
{

namespace asio = boost::asio;
using asio::ip::tcp;
constexpr auto asTuple = asio::as_tuple(asio::use_awaitable);

/// How long a stop waits for requests in hand.
constexpr std::chrono::seconds stopPatience{10};
/// When the system refuses a connection for want of descriptors or memory.
constexpr std::chrono::seconds acceptPause{1};

Limits limitsOf(const Config &config, const Capacity &capacity)
{
    Limits limits = config.limits;
    limits.pushStreams = std::min(limits.pushStreams, capacity.pushStreams);
    return limits;
}

} // namespace

struct Server::State {
    State(const Config &config, Metadata &metadata, Blobs &blobs, std::function<Seconds()> now,
          std::unique_ptr<Peers> others)
        : timeouts(config.timeouts), peers(std::move(others)), pool(storageThreads), writes(*peers),
          pushes(io.get_executor(), limitsOf(config, capacity)),
          context{metadata,      blobs,          *peers,          pool, writes, pushes,
                  config.limits, std::move(now), config.publicUrl},
          sweeper(io.get_executor(), context), acceptor(io), signals(io, SIGTERM, SIGINT),
          stopTimer(io), room(io, asio::steady_timer::time_point::max())
    {
    }

    [[nodiscard]] Peers::Ears ears();
    void listen(const ListenAddress &address);
    Task<void> acceptAll();
    Task<void> serve(std::shared_ptr<Connection> connection);
    Task<void> waitForSignals();
    Task<void> cutAfterPatience();
    void stop();

    const Capacity capacity = claimCapacity();
    Timeouts timeouts;
    asio::io_context io{1};
    std::unique_ptr<Peers> peers;
    StoragePool pool;
    ActiveWrites writes;
    PushHub pushes;
    Context context;
    Sweeper sweeper;
    tcp::acceptor acceptor;
    asio::signal_set signals;
    asio::steady_timer stopTimer;
    /// Cancelled when a connection leaves, for an acceptor that waits for room.
    asio::steady_timer room;
    std::set<std::shared_ptr<Connection>> connections;
    std::string url;
    bool stopping = false;
    /// Nothing is waited for any more.
    bool ended = false;
};

/// What other servers tell, brought to the network thread.
Peers::Ears Server::State::ears()
{
    Peers::Ears ears;
    ears.pushes = [this](const std::vector<std::int64_t> &accounts) {
        asio::dispatch(io, [this, accounts] { pushes.announce(accounts); });
    };
    ears.missed = [this] { asio::dispatch(io, [this] { pushes.announceAll(); }); };
    ears.stopWriting = [this](const std::string &blob) {
        asio::dispatch(io, [this, blob] { writes.stop(blob); });
    };
    ears.stopAllWriting = [this] { asio::dispatch(io, [this] { writes.stopAll(); }); };
    ears.sweep = [this] { asio::dispatch(io, [this] { sweeper.wake(); }); };
    return ears;
}

void Server::State::listen(const ListenAddress &address)
{
    boost::system::error_code error;
    const auto ip = asio::ip::make_address(address.host, error);
    if (error)
        throw std::runtime_error("\"" + address.host + "\" is not an IP address");
    const tcp::endpoint endpoint(ip, address.port);
    acceptor.open(endpoint.protocol());
    acceptor.set_option(tcp::acceptor::reuse_address(true));
    acceptor.bind(endpoint, error);
    if (error)
        throw std::runtime_error("cannot listen on " + address.host + ":" +
                                 std::to_string(address.port) + ": " + error.message());
    acceptor.listen();
    const std::string host = ip.is_v6() ? "[" + address.host + "]" : address.host;
    url = "http://" + host + ":" + std::to_string(acceptor.local_endpoint().port());
    if (context.publicUrl.empty())
        context.publicUrl = url;
}

Task<void> Server::State::serve(std::shared_ptr<Connection> connection)
{
    connections.insert(connection);
    co_await connection->run();
    connections.erase(connection);
    room.cancel();
    if (stopping && connections.empty())
        stopTimer.cancel();
}

Task<void> Server::State::acceptAll()
{
    while (!stopping) {
        if (connections.size() >= capacity.connections) {
            co_await room.async_wait(asTuple);
            continue;
        }
        auto [error, socket] = co_await acceptor.async_accept(asTuple);
        if (stopping)
            co_return;
        if (error) {
            std::fprintf(stderr, "pelliko-server: accept: %s\n", error.message().c_str());
            stopTimer.expires_after(acceptPause);
            co_await stopTimer.async_wait(asTuple);
            continue;
        }
        auto connection = Connection::make(
            std::move(socket), timeouts, pool,
            [this](Exchange &exchange) { return handleRequest(exchange, context); }, refuseHead);
        asio::co_spawn(io, serve(std::move(connection)), asio::detached);
    }
}

Task<void> Server::State::waitForSignals()
{
    auto [error, number] = co_await signals.async_wait(asTuple);
    if (error)
        co_return;
    stop();
    if (ended)
        co_return;
    // A second signal is a person who does not want to wait.
    auto [again, second] = co_await signals.async_wait(asTuple);
    if (!again)
        stopTimer.cancel();
}

/// Uploads are ended at once, since what arrived is kept; downloads get some time.
void Server::State::stop()
{
    if (std::exchange(stopping, true))
        return;
    boost::system::error_code ignored;
    acceptor.close(ignored);
    room.cancel();
    sweeper.stop();
    writes.stopAll();
    pushes.stop();
    for (const auto &connection : std::set(connections))
        connection->finish();
    asio::co_spawn(io, cutAfterPatience(), asio::detached);
}

Task<void> Server::State::cutAfterPatience()
{
    stopTimer.expires_after(stopPatience);
    if (!connections.empty())
        co_await stopTimer.async_wait(asTuple);
    for (const auto &connection : std::set(connections))
        connection->cut();
    ended = true;
    signals.cancel();
}

Server::Server(const Config &config, Metadata &metadata, Blobs &blobs, std::function<Seconds()> now,
               std::unique_ptr<Peers> peers)
    : m_state(std::make_unique<State>(config, metadata, blobs, std::move(now),
                                      peers ? std::move(peers) : std::make_unique<NoPeers>()))
{
    m_state->listen(parseListenAddress(config.listen));
}

Server::~Server()
{
    m_state->peers->close();
    m_state->pool.join();
}

std::string Server::url() const
{
    return m_state->url;
}

void Server::run()
{
    m_state->peers->listen(m_state->ears());
    asio::co_spawn(m_state->io, m_state->acceptAll(), asio::detached);
    asio::co_spawn(m_state->io, m_state->waitForSignals(), asio::detached);
    asio::co_spawn(m_state->io, m_state->sweeper.run(), asio::detached);
    asio::co_spawn(m_state->io, m_state->pushes.run(), asio::detached);
    m_state->io.run();
}

void Server::stop()
{
    asio::post(m_state->io, [this] { m_state->stop(); });
}

void Server::sweep()
{
    asio::post(m_state->io, [this] { m_state->sweeper.wake(); });
}

} // namespace pelliko::server
