#include "Server.h"

#include "Sweeper.h"
#include "http/Capacity.h"
#include "http/Connection.h"
#include "http/Router.h"
#include "monitoring/Monitoring.h"

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

/// What an upload that was ended at a stop gets to note how far it came.
constexpr std::chrono::seconds lastWords{5};
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
        : timeouts(config.timeouts), drain(config.drain), peers(std::move(others)),
          blobPool(std::max(storageThreads, blobs.callsAtOnce())), writes(*peers),
          pushes(io.get_executor(), limitsOf(config, capacity), !peers->tellsOfTokens()),
          context{metadata, blobs,  *peers,        pool,           blobPool,
                  writes,   pushes, config.limits, std::move(now), config.publicUrl},
          sweeper(io.get_executor(), context), acceptor(io), monitorAcceptor(io),
          signals(io, SIGTERM, SIGINT), stopTimer(io),
          room(io, asio::steady_timer::time_point::max())
    {
        context.levels = [this] { return levels(); };
        context.doubt = [this](const std::string &blob) { sweeper.doubt(blob); };
        for (const std::string &proxy : config.trustedProxies)
            context.proxies.push_back(normalAddress(proxy));
    }

    [[nodiscard]] Peers::Ears ears();
    std::string listen(tcp::acceptor &on, const ListenAddress &address);
    [[nodiscard]] Levels levels() const;
    Task<void> acceptAll();
    void admit(tcp::socket socket);
    void takeWaiting();
    Task<void> serve(std::shared_ptr<Connection> connection);
    Task<void> acceptMonitors();
    Task<void> serveMonitor(std::shared_ptr<Connection> connection);
    Task<void> waitForSignals();
    Task<void> cutAfterDrain();
    void cutAll();
    void stop();

    const Capacity capacity = claimCapacity();
    Timeouts timeouts;
    std::chrono::seconds drain;
    asio::io_context io{1};
    std::unique_ptr<Peers> peers;
    StoragePool pool{storageThreads};
    StoragePool blobPool;
    ActiveWrites writes;
    PushHub pushes;
    Context context;
    Sweeper sweeper;
    tcp::acceptor acceptor;
    tcp::acceptor monitorAcceptor;
    asio::signal_set signals;
    asio::steady_timer stopTimer;
    /// Cancelled when a connection leaves, for an acceptor that waits for room.
    asio::steady_timer room;
    std::set<std::shared_ptr<Connection>> connections;
    /// Not waited for at a stop, and answered until it is over.
    std::set<std::shared_ptr<Connection>> monitors;
    std::string url;
    std::string monitoringUrl;
    bool stopping = false;
    /// Somebody does not want to wait for requests in hand.
    bool hurried = false;
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

/// Returns the address that is listened on.
std::string Server::State::listen(tcp::acceptor &on, const ListenAddress &address)
{
    boost::system::error_code error;
    const auto ip = asio::ip::make_address(address.host, error);
    if (error)
        throw std::runtime_error("\"" + address.host + "\" is not an IP address");
    const tcp::endpoint endpoint(ip, address.port);
    on.open(endpoint.protocol());
    on.set_option(tcp::acceptor::reuse_address(true));
    on.bind(endpoint, error);
    if (error)
        throw std::runtime_error("cannot listen on " + address.host + ":" +
                                 std::to_string(address.port) + ": " + error.message());
    on.listen();
    const std::string host = ip.is_v6() ? "[" + address.host + "]" : address.host;
    return "http://" + host + ":" + std::to_string(on.local_endpoint().port());
}

Levels Server::State::levels() const
{
    return {connections.size(), pushes.count(), writes.count(), pool.inHand() + blobPool.inHand(),
            stopping};
}

Task<void> Server::State::serve(std::shared_ptr<Connection> connection)
{
    co_await connection->run();
    connections.erase(connection);
    room.cancel();
    if (stopping && connections.empty())
        stopTimer.cancel();
}

/// Takes a client in; one that comes while the server ends is answered once.
void Server::State::admit(tcp::socket socket)
{
    auto connection = Connection::make(
        std::move(socket), timeouts, blobPool,
        [this](Exchange &exchange) { return handleRequest(exchange, context); }, refuseHead);
    if (stopping)
        connection->finish();
    connections.insert(connection);
    asio::co_spawn(io, serve(std::move(connection)), asio::detached);
}

/// The system has taken connections that it was not asked for yet. Who opened one may have sent a
/// request, and could not tell whether it was dealt with when the connection is dropped.
void Server::State::takeWaiting()
{
    boost::system::error_code error;
    acceptor.non_blocking(true, error);
    while (!error && connections.size() < capacity.connections) {
        tcp::socket socket(io);
        acceptor.accept(socket, error);
        if (!error)
            admit(std::move(socket));
    }
}

Task<void> Server::State::acceptAll()
{
    while (!stopping) {
        if (connections.size() >= capacity.connections) {
            co_await room.async_wait(asTuple);
            continue;
        }
        auto [error, socket] = co_await acceptor.async_accept(asTuple);
        if (error && stopping)
            co_return;
        if (error) {
            std::fprintf(stderr, "pelliko-server: accept: %s\n", error.message().c_str());
            stopTimer.expires_after(acceptPause);
            co_await stopTimer.async_wait(asTuple);
            continue;
        }
        admit(std::move(socket));
    }
}

Task<void> Server::State::serveMonitor(std::shared_ptr<Connection> connection)
{
    monitors.insert(connection);
    co_await connection->run();
    monitors.erase(connection);
}

Task<void> Server::State::acceptMonitors()
{
    while (monitorAcceptor.is_open()) {
        auto [error, socket] = co_await monitorAcceptor.async_accept(asTuple);
        if (error && monitorAcceptor.is_open()) {
            asio::steady_timer pause(io, acceptPause);
            co_await pause.async_wait(asTuple);
            continue;
        }
        if (error)
            co_return;
        auto connection = Connection::make(
            std::move(socket), timeouts, blobPool,
            [this](Exchange &exchange) { return handleMonitoring(exchange, context); }, refuseHead);
        asio::co_spawn(io, serveMonitor(std::move(connection)), asio::detached);
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
    if (again)
        co_return;
    hurried = true;
    stopTimer.cancel();
}

/// Nobody new is taken, and streams end, since they would never end by themselves: whoever had one
/// comes back, to another server where there is one. Requests in hand go on for a while.
void Server::State::stop()
{
    if (std::exchange(stopping, true))
        return;
    takeWaiting();
    boost::system::error_code ignored;
    acceptor.close(ignored);
    room.cancel();
    sweeper.stop();
    pushes.stop();
    for (const auto &connection : std::set(connections))
        connection->finish();
    asio::co_spawn(io, cutAfterDrain(), asio::detached);
}

Task<void> Server::State::cutAfterDrain()
{
    stopTimer.expires_after(drain);
    if (!connections.empty() && !hurried)
        co_await stopTimer.async_wait(asTuple);
    // An upload that is ended keeps what arrived and goes on later.
    writes.stopAll();
    stopTimer.expires_after(lastWords);
    if (!connections.empty() && !hurried)
        co_await stopTimer.async_wait(asTuple);
    cutAll();
    ended = true;
    signals.cancel();
}

void Server::State::cutAll()
{
    boost::system::error_code ignored;
    monitorAcceptor.close(ignored);
    for (const auto &connection : std::set(connections))
        connection->cut();
    for (const auto &connection : std::set(monitors))
        connection->cut();
}

Server::Server(const Config &config, Metadata &metadata, Blobs &blobs, std::function<Seconds()> now,
               std::unique_ptr<Peers> peers)
    : m_state(std::make_unique<State>(config, metadata, blobs, std::move(now),
                                      peers ? std::move(peers) : std::make_unique<NoPeers>()))
{
    m_state->url = m_state->listen(m_state->acceptor, parseListenAddress(config.listen));
    if (m_state->context.publicUrl.empty())
        m_state->context.publicUrl = m_state->url;
    if (!config.monitoring.empty())
        m_state->monitoringUrl =
            m_state->listen(m_state->monitorAcceptor, parseListenAddress(config.monitoring));
}

Server::~Server()
{
    m_state->peers->close();
    m_state->pool.join();
    m_state->blobPool.join();
}

std::string Server::url() const
{
    return m_state->url;
}

std::string Server::monitoringUrl() const
{
    return m_state->monitoringUrl;
}

void Server::run()
{
    m_state->peers->listen(m_state->ears());
    asio::co_spawn(m_state->io, m_state->acceptAll(), asio::detached);
    asio::co_spawn(m_state->io, m_state->acceptMonitors(), asio::detached);
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
