#include "http/BodyReader.h"

#include "http/Errors.h"

#include <boost/asio/as_tuple.hpp>
#include <boost/asio/buffer.hpp>
#include <boost/asio/use_awaitable.hpp>
#include <boost/beast/core/flat_buffer.hpp>
#include <boost/beast/http/buffer_body.hpp>
#include <boost/beast/http/empty_body.hpp>
#include <boost/beast/http/parser.hpp>
#include <boost/beast/http/read.hpp>

#include <sys/socket.h>

#include <algorithm>
#include <cerrno>
#include <limits>
#include <utility>

namespace pelliko::server
{
namespace
{

namespace asio = boost::asio;
namespace http = boost::beast::http;
constexpr auto asTuple = asio::as_tuple(asio::use_awaitable);

constexpr std::uint32_t headLimit = 16 * 1024;
/// Room for a head and for the first bytes of a body that come with it.
constexpr std::size_t bufferLimit = 64 * 1024;
/// What is taken from a socket with one call.
constexpr std::size_t takeSize = 256 * 1024;

using HeadParser = http::request_parser<http::empty_body>;
using ChunkParser = http::request_parser<http::buffer_body>;

/// Removes "http://host" of the form that proxies send, and the query.
std::string pathOf(std::string_view target)
{
    if (const auto scheme = target.find("://"); scheme < 6) {
        const auto path = target.find('/', scheme + 3);
        target = path == std::string_view::npos ? "/" : target.substr(path);
    }
    return std::string(target.substr(0, target.find('?')));
}

Request requestOf(HeadParser &parser)
{
    Request request;
    const auto &message = parser.get();
    request.method = std::string(message.method_string());
    request.path = pathOf({message.target().data(), message.target().size()});
    for (const auto &field : message) {
        request.headers.push_back({std::string(field.name_string()), std::string(field.value())});
    }
    if (!parser.chunked())
        request.bodyLength = parser.content_length().value_or(0);
    return request;
}

/// One for each thread, not for each body: most bodies wait for their network most of the time.
std::span<char> takeBuffer()
{
    static thread_local const auto buffer = std::make_unique_for_overwrite<char[]>(takeSize);
    return {buffer.get(), takeSize};
}

} // namespace

struct BodyReader::State {
    State(asio::ip::tcp::socket &s, Watchdog &w, std::chrono::seconds p)
        : socket(s), watchdog(w), progressTimeout(p), buffer(bufferLimit)
    {
    }

    asio::ip::tcp::socket &socket;
    Watchdog &watchdog;
    std::chrono::seconds progressTimeout;
    boost::beast::flat_buffer buffer;
    std::optional<HeadParser> head;
    std::optional<ChunkParser> chunks;
    Request request;
    std::uint64_t remaining = 0;
    bool keepAlive = false;
    bool takesChunks = false;
    bool awaitsContinue = false;
    bool interrupted = false;
    /// The socket may have bytes that nobody has waited for.
    bool mayHaveMore = false;
};

BodyReader::BodyReader(asio::ip::tcp::socket &socket, Watchdog &watchdog,
                       std::chrono::seconds progressTimeout)
    : m_state(std::make_unique<State>(socket, watchdog, progressTimeout))
{
}

BodyReader::~BodyReader() = default;

const Request &BodyReader::request() const
{
    return m_state->request;
}
bool BodyReader::keepAlive() const
{
    return m_state->keepAlive;
}
bool BodyReader::peerTakesChunks() const
{
    return m_state->takesChunks;
}
bool BodyReader::hasBufferedBytes() const
{
    return m_state->buffer.size() > 0;
}

void BodyReader::interrupt()
{
    m_state->interrupted = true;
    boost::system::error_code ignored;
    m_state->socket.cancel(ignored);
}

bool BodyReader::peerAwaitsContinue()
{
    return std::exchange(m_state->awaitsContinue, false);
}

std::uint64_t BodyReader::restOfBody() const
{
    const bool unknown = m_state->chunks && !m_state->chunks->is_done();
    if (unknown || m_state->awaitsContinue || m_state->interrupted)
        return std::numeric_limits<std::uint64_t>::max();
    return m_state->remaining;
}

Task<HeadResult> BodyReader::readHead()
{
    State &state = *m_state;
    state.chunks.reset();
    state.head.emplace();
    state.head->header_limit(headLimit);
    state.head->body_limit(boost::none);
    state.request = {};
    state.keepAlive = state.interrupted = state.mayHaveMore = false;
    state.remaining = 0;
    auto [error, count] =
        co_await http::async_read_header(state.socket, state.buffer, *state.head, asTuple);
    if (error == http::error::header_limit || error == http::error::buffer_overflow)
        co_return HeadResult::tooLarge;
    if (error == http::error::end_of_stream || error == http::error::partial_message)
        co_return HeadResult::closed;
    if (error) {
        const bool malformed = error.category() == http::make_error_code(http::error{}).category();
        co_return malformed ? HeadResult::malformed : HeadResult::closed;
    }
    state.request = requestOf(*state.head);
    boost::system::error_code gone;
    const auto peer = state.socket.remote_endpoint(gone);
    state.request.peer = gone ? std::string() : peer.address().to_string();
    state.takesChunks = state.head->get().version() >= 11;
    if (state.takesChunks && state.request.header("Host") == nullptr)
        co_return HeadResult::malformed;
    state.keepAlive = state.head->keep_alive();
    state.remaining = state.request.bodyLength.value_or(0);
    const std::string *expect = state.request.header("Expect");
    const bool hasBody = !state.request.bodyLength || state.remaining > 0;
    state.awaitsContinue = expect != nullptr && state.takesChunks && hasBody &&
                           equalsIgnoringCase(*expect, "100-continue");
    if (!state.request.bodyLength)
        state.chunks.emplace(std::move(*state.head));
    co_return HeadResult::complete;
}

Task<std::size_t> BodyReader::readBody(std::span<char> into)
{
    if (m_state->interrupted)
        throw Interrupted();
    if (m_state->chunks)
        co_return co_await readChunked(into);
    co_return co_await readPlain(into);
}

Task<std::size_t> BodyReader::readPlain(std::span<char> into)
{
    State &state = *m_state;
    const auto wanted =
        static_cast<std::size_t>(std::min<std::uint64_t>(state.remaining, into.size()));
    if (wanted == 0)
        co_return 0;
    if (state.buffer.size() > 0) {
        const std::size_t count =
            asio::buffer_copy(asio::buffer(into.data(), wanted), state.buffer.data());
        state.buffer.consume(count);
        state.remaining -= count;
        co_return count;
    }
    state.watchdog.arm(state.progressTimeout);
    auto [error, count] =
        co_await state.socket.async_read_some(asio::buffer(into.data(), wanted), asTuple);
    state.watchdog.disarm();
    state.remaining -= count;
    if (count > 0)
        co_return count;
    if (state.interrupted)
        throw Interrupted();
    throw Disconnected();
}

Task<bool> BodyReader::awaitPlainBytes()
{
    State &state = *m_state;
    if (state.interrupted)
        throw Interrupted();
    if (state.chunks || state.buffer.size() > 0 || state.remaining == 0)
        co_return false;
    if (!state.mayHaveMore) {
        state.watchdog.arm(state.progressTimeout);
        auto [error] = co_await state.socket.async_wait(asio::ip::tcp::socket::wait_read, asTuple);
        state.watchdog.disarm();
        if (state.interrupted)
            throw Interrupted();
        if (error)
            throw Disconnected();
    }
    co_return true;
}

/// Returns 0 when the socket has nothing now, and when the peer is gone: then it may have more.
std::size_t BodyReader::receiveNow(std::span<char> into)
{
    State &state = *m_state;
    const auto wanted =
        static_cast<std::size_t>(std::min<std::uint64_t>(state.remaining, into.size()));
    ssize_t count = -1;
    do
        count = ::recv(state.socket.native_handle(), into.data(), wanted, MSG_DONTWAIT);
    while (count < 0 && errno == EINTR);
    const bool failed = count == 0 || (count < 0 && errno != EAGAIN);
    const auto received = static_cast<std::size_t>(std::max<ssize_t>(count, 0));
    // Less than what was asked for is all that there was.
    state.mayHaveMore = failed || received == wanted;
    state.remaining -= received;
    return received;
}

std::size_t BodyReader::takeNow(std::size_t most, BodySink &sink)
{
    State &state = *m_state;
    const std::span<char> buffer = takeBuffer();
    state.mayHaveMore = true;
    std::size_t taken = 0;
    while (taken < most && state.remaining > 0 && state.mayHaveMore) {
        const std::size_t count = receiveNow(buffer.first(std::min(buffer.size(), most - taken)));
        if (count == 0 && state.mayHaveMore && taken == 0)
            throw Disconnected();
        if (count == 0)
            break;
        taken += count;
        sink.take({buffer.data(), count});
    }
    return taken;
}

std::optional<std::size_t> BodyReader::fillNow(std::size_t most, BodySink &sink)
{
    State &state = *m_state;
    state.mayHaveMore = true;
    std::size_t filled = 0;
    const BodySink::Filler fill = [&](std::span<char> room) {
        return receiveNow(room.first(std::min(room.size(), most - filled)));
    };
    while (filled < most && state.remaining > 0 && state.mayHaveMore) {
        const std::optional<std::size_t> count = sink.fillNow(fill);
        if (!count && filled == 0)
            return std::nullopt;
        if (count == 0 && state.mayHaveMore && filled == 0)
            throw Disconnected();
        if (!count || count == 0)
            break;
        filled += *count;
    }
    // What else there is has to wait until others had their turn on this thread.
    state.mayHaveMore = false;
    return filled;
}

Task<std::size_t> BodyReader::readChunked(std::span<char> into)
{
    State &state = *m_state;
    while (!state.chunks->is_done()) {
        auto &body = state.chunks->get().body();
        body.data = into.data();
        body.size = into.size();
        state.watchdog.arm(state.progressTimeout);
        auto [error, count] =
            co_await http::async_read_some(state.socket, state.buffer, *state.chunks, asTuple);
        state.watchdog.disarm();
        const std::size_t got = into.size() - body.size;
        if (got > 0)
            co_return got;
        if (error && error != http::error::need_buffer) {
            if (state.interrupted)
                throw Interrupted();
            const bool malformed =
                error.category() == http::make_error_code(http::error{}).category();
            if (malformed && error != http::error::end_of_stream &&
                error != http::error::partial_message)
                throw Refusal(Error::badRequest, "The body's chunks are malformed.");
            throw Disconnected();
        }
    }
    co_return 0;
}

} // namespace pelliko::server
