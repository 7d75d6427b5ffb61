#include "http/Connection.h"

#include "http/BodyReader.h"
#include "http/ResponseHead.h"
#include "http/Watchdog.h"

#include <boost/asio/as_tuple.hpp>
#include <boost/asio/buffer.hpp>
#include <boost/asio/co_spawn.hpp>
#include <boost/asio/detached.hpp>
#include <boost/asio/use_awaitable.hpp>
#include <boost/asio/write.hpp>

#include <sys/sendfile.h>
#include <sys/socket.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdio>
#include <ctime>
#include <utility>
#include <vector>

namespace pelliko::server
{
namespace
{

namespace asio = boost::asio;
using asio::ip::tcp;
constexpr auto asTuple = asio::as_tuple(asio::use_awaitable);

/// An unread rest of a body up to this is read away; a longer one costs the connection.
constexpr std::uint64_t drainLimit = 256 * 1024;
/// A chunk up to this goes out in one packet with its frame; copying a longer one costs more.
constexpr std::size_t joinedChunk = 4096;
/// Of a body that does not come straight from the socket: in chunks, or with its head.
constexpr std::size_t otherPiece = 64 * 1024;
/// One call of the kernel's copy; bounds how long a thread of the pool serves one download.
constexpr std::uint64_t sendStep = 1024 * 1024;

class ConnectionImpl final : public Connection,
                             public Exchange,
                             public std::enable_shared_from_this<ConnectionImpl>
{
public:
    ConnectionImpl(tcp::socket socket, const Timeouts &timeouts, StoragePool &pool, Handler handler,
                   HeadRefused headRefused)
        : m_socket(std::move(socket)), m_timeouts(timeouts), m_pool(pool),
          m_handler(std::move(handler)), m_headRefused(std::move(headRefused)),
          m_watchdog(m_socket.get_executor()), m_reader(m_socket, m_watchdog, timeouts.progress)
    {
    }

    Task<void> run() override;
    void finish() override;
    void cut() override;

    [[nodiscard]] const Request &request() const override { return m_reader.request(); }
    Task<std::size_t> readBody(std::span<char> into) override;
    Task<std::size_t> takeBody(std::size_t most, BodySink &sink) override;
    void interrupt() override { m_reader.interrupt(); }
    Task<void> respond(Response response) override;
    Task<void> startStream(Response head, std::optional<std::uint64_t> length) override;
    Task<void> write(std::string_view bytes) override;
    Task<void> sendFile(int file, std::uint64_t offset, std::uint64_t length) override;
    Task<void> endStream() override;
    void watchPeer(std::function<void()> gone) override;
    [[nodiscard]] Traffic traffic() const override { return m_traffic; }

private:
    Task<void> awaitPeer(std::shared_ptr<ConnectionImpl> self);
    [[nodiscard]] bool peerClosed();
    Task<void> watch(std::shared_ptr<ConnectionImpl> self);
    Task<bool> waitForRequest();
    Task<bool> serveOne();
    Task<void> drainBody();
    Task<void> linger();
    Task<void> sendAll(std::string_view bytes);
    bool decideKeepAlive();
    [[nodiscard]] bool isHead() const { return request().method == "HEAD"; }

    tcp::socket m_socket;
    Timeouts m_timeouts;
    StoragePool &m_pool;
    Handler m_handler;
    HeadRefused m_headRefused;
    Watchdog m_watchdog;
    BodyReader m_reader;
    std::function<void()> m_peerGone;
    bool m_idle = false;
    bool m_finishing = false;
    bool m_served = false;
    Traffic m_traffic;
    bool m_keepAlive = true;
    bool m_chunked = false;
};

Task<void> ConnectionImpl::watch(std::shared_ptr<ConnectionImpl> self)
{
    const bool expired = co_await m_watchdog.expired();
    if (expired)
        self->cut();
}

Task<void> ConnectionImpl::run()
{
    asio::co_spawn(m_socket.get_executor(), watch(shared_from_this()), asio::detached);
    boost::system::error_code ignored;
    m_socket.set_option(tcp::no_delay(true), ignored);
    m_socket.native_non_blocking(true, ignored);
    try {
        bool more = true;
        while (more)
            more = co_await serveOne();
    } catch (const Disconnected &) {
        // The peer left; whoever used the connection has seen to what arrived.
    } catch (const std::exception &error) {
        std::fprintf(stderr, "pelliko-server: connection: %s\n", error.what());
    }
    m_watchdog.stop();
    m_socket.close(ignored);
}

void ConnectionImpl::finish()
{
    m_finishing = true;
    boost::system::error_code ignored;
    if (!m_idle || m_socket.available(ignored) > 0)
        return;
    // Who has just connected did so for a request, and could not tell whether it was dealt with.
    if (m_served)
        cut();
    else
        m_watchdog.arm(m_timeouts.firstWords);
}

void ConnectionImpl::cut()
{
    // Not closed: a thread of the pool may be sending on the descriptor.
    boost::system::error_code ignored;
    m_socket.shutdown(tcp::socket::shutdown_both, ignored);
    m_socket.cancel(ignored);
}

Task<bool> ConnectionImpl::waitForRequest()
{
    if (m_reader.hasBufferedBytes())
        co_return true;
    m_idle = true;
    m_watchdog.arm(m_finishing ? m_timeouts.firstWords : m_timeouts.idle);
    auto [error] = co_await m_socket.async_wait(tcp::socket::wait_read, asTuple);
    m_watchdog.disarm();
    m_idle = false;
    co_return !error;
}

Task<bool> ConnectionImpl::serveOne()
{
    const bool arrived = co_await waitForRequest();
    if (!arrived)
        co_return false;
    m_served = true;
    m_traffic = {};
    m_chunked = false;
    m_keepAlive = true;
    m_watchdog.arm(m_timeouts.head);
    const HeadResult head = co_await m_reader.readHead();
    m_watchdog.disarm();
    if (head == HeadResult::closed)
        co_return false;
    if (head != HeadResult::complete) {
        m_keepAlive = false;
        co_await respond(m_headRefused(head == HeadResult::tooLarge));
        co_await linger();
        co_return false;
    }
    co_await m_handler(*this);
    if (!answered())
        co_return false;
    if (!m_keepAlive) {
        co_await linger();
        co_return false;
    }
    co_await drainBody();
    co_return !m_finishing;
}

Task<void> ConnectionImpl::drainBody()
{
    std::array<char, 16384> rest;
    std::size_t count = 1;
    while (count > 0)
        count = co_await m_reader.readBody(rest);
}

/// Closing with unread bytes would reset the connection and might take the answer with it.
Task<void> ConnectionImpl::linger()
{
    boost::system::error_code ignored;
    m_socket.shutdown(tcp::socket::shutdown_send, ignored);
    m_watchdog.arm(m_timeouts.linger);
    std::array<char, 16384> rest;
    while (true) {
        auto [error, count] = co_await m_socket.async_read_some(asio::buffer(rest), asTuple);
        if (error || count == 0)
            co_return;
    }
}

Task<std::size_t> ConnectionImpl::readBody(std::span<char> into)
{
    if (m_reader.peerAwaitsContinue())
        co_await sendAll("HTTP/1.1 100 Continue\r\n\r\n");
    const std::size_t count = co_await m_reader.readBody(into);
    m_traffic.received += count;
    co_return count;
}

/// Where bytes come fast, receiving and storing them on one thread saves two changes of threads for
/// each piece; where they only have to be put somewhere, it is this one.
Task<std::size_t> ConnectionImpl::takeBody(std::size_t most, BodySink &sink)
{
    if (m_reader.peerAwaitsContinue())
        co_await sendAll("HTTP/1.1 100 Continue\r\n\r\n");
    std::size_t taken = 0;
    while (taken == 0) {
        const bool plain = co_await m_reader.awaitPlainBytes();
        if (!plain)
            break;
        const std::optional<std::size_t> filled = m_reader.fillNow(most, sink);
        auto step = [&] { return m_reader.takeNow(most, sink); };
        if (filled)
            taken = *filled;
        else
            taken = co_await m_pool.run(step);
        m_traffic.received += taken;
    }
    if (taken > 0)
        co_return taken;
    std::vector<char> piece(std::min(most, otherPiece));
    taken = co_await m_reader.readBody(piece);
    m_traffic.received += taken;
    auto last = [&] { sink.take({piece.data(), taken}); };
    if (taken > 0)
        co_await m_pool.run(last);
    co_return taken;
}

bool ConnectionImpl::decideKeepAlive()
{
    m_keepAlive =
        m_keepAlive && m_reader.keepAlive() && !m_finishing && m_reader.restOfBody() <= drainLimit;
    return m_keepAlive;
}

Task<void> ConnectionImpl::respond(Response response)
{
    m_traffic.status = response.status;
    std::string bytes = responseHead(response, {decideKeepAlive(), response.body.size(), false},
                                     std::time(nullptr));
    if (!isHead()) {
        bytes += response.body;
        m_traffic.sent += response.body.size();
    }
    co_await sendAll(bytes);
}

Task<void> ConnectionImpl::startStream(Response head, std::optional<std::uint64_t> length)
{
    m_traffic.status = head.status;
    m_chunked = !length && m_reader.peerTakesChunks();
    if (!length && !m_chunked)
        m_keepAlive = false;
    co_await sendAll(
        responseHead(head, {decideKeepAlive(), length, m_chunked}, std::time(nullptr)));
}

Task<void> ConnectionImpl::write(std::string_view bytes)
{
    if (isHead() || bytes.empty())
        co_return;
    m_traffic.sent += bytes.size();
    if (!m_chunked) {
        co_await sendAll(bytes);
        co_return;
    }
    std::array<char, 24> size{};
    std::snprintf(size.data(), size.size(), "%zx\r\n", bytes.size());
    if (bytes.size() <= joinedChunk) {
        const std::string chunk = size.data() + std::string(bytes) + "\r\n";
        co_await sendAll(chunk);
        co_return;
    }
    co_await sendAll(size.data());
    co_await sendAll(bytes);
    co_await sendAll("\r\n");
}

Task<void> ConnectionImpl::endStream()
{
    if (m_chunked && !isHead())
        co_await sendAll("0\r\n\r\n");
}

void ConnectionImpl::watchPeer(std::function<void()> gone)
{
    m_peerGone = std::move(gone);
    if (m_peerGone) {
        asio::co_spawn(m_socket.get_executor(), awaitPeer(shared_from_this()), asio::detached);
        return;
    }
    boost::system::error_code ignored;
    m_socket.cancel(ignored);
}

Task<void> ConnectionImpl::awaitPeer(std::shared_ptr<ConnectionImpl> self)
{
    if (self->m_reader.hasBufferedBytes())
        co_return;
    auto [error] = co_await self->m_socket.async_wait(tcp::socket::wait_read, asTuple);
    if (self->m_peerGone && (error || self->peerClosed()))
        std::exchange(self->m_peerGone, {})();
}

bool ConnectionImpl::peerClosed()
{
    char byte = 0;
    const ssize_t count = ::recv(m_socket.native_handle(), &byte, 1, MSG_PEEK | MSG_DONTWAIT);
    return count == 0 || (count < 0 && errno != EAGAIN && errno != EINTR);
}

Task<void> ConnectionImpl::sendAll(std::string_view bytes)
{
    while (!bytes.empty()) {
        m_watchdog.arm(m_timeouts.progress);
        auto [error, count] =
            co_await m_socket.async_write_some(asio::buffer(bytes.data(), bytes.size()), asTuple);
        m_watchdog.disarm();
        if (error)
            throw Disconnected();
        bytes.remove_prefix(count);
    }
}

Task<void> ConnectionImpl::sendFile(int file, std::uint64_t offset, std::uint64_t length)
{
    if (isHead())
        co_return;
    const int socket = m_socket.native_handle();
    auto position = static_cast<off_t>(offset);
    int failure = 0;
    auto step = [&] {
        const ssize_t sent = ::sendfile(socket, file, &position, std::min(length, sendStep));
        failure = sent < 0 ? errno : 0;
        return sent;
    };
    while (length > 0) {
        const ssize_t sent = co_await m_pool.run(step);
        if (sent > 0) {
            length -= static_cast<std::uint64_t>(sent);
            m_traffic.sent += static_cast<std::uint64_t>(sent);
            continue;
        }
        if (sent == 0 || (failure != EAGAIN && failure != EINTR))
            throw Disconnected();
        m_watchdog.arm(m_timeouts.progress);
        auto [error] = co_await m_socket.async_wait(tcp::socket::wait_write, asTuple);
        m_watchdog.disarm();
        if (error)
            throw Disconnected();
    }
}

} // namespace

std::shared_ptr<Connection> Connection::make(tcp::socket socket, const Timeouts &timeouts,
                                             StoragePool &pool, Handler handler,
                                             HeadRefused headRefused)
{
    return std::make_shared<ConnectionImpl>(std::move(socket), timeouts, pool, std::move(handler),
                                            std::move(headRefused));
}

} // namespace pelliko::server
