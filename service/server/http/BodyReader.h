#pragma once

#include "http/Exchange.h"
#include "http/Watchdog.h"

#include <boost/asio/ip/tcp.hpp>

#include <chrono>
#include <memory>

namespace pelliko::server
{

enum class HeadResult { complete, closed, tooLarge, malformed };

/// Reads requests from a socket: the head through a parser, a body of known length straight from
/// the socket, which is several times cheaper than through the parser.
class BodyReader
{
public:
    BodyReader(boost::asio::ip::tcp::socket &socket, Watchdog &watchdog,
               std::chrono::seconds progressTimeout);
    ~BodyReader();
    BodyReader(const BodyReader &) = delete;
    BodyReader &operator=(const BodyReader &) = delete;

    /// Reads the next request's head; the former body has to be read completely.
    Task<HeadResult> readHead();
    [[nodiscard]] const Request &request() const;

    Task<std::size_t> readBody(std::span<char> into);
    /// Waits until the socket has bytes of the body; false when they have to be read with readBody,
    /// or when there are none left.
    Task<bool> awaitPlainBytes();
    /// Has `sink` take what the socket has now, up to `most` bytes of the body, and returns how
    /// much that was. After awaitPlainBytes; may run on another thread while nothing else is asked.
    std::size_t takeNow(std::size_t most, BodySink &sink);
    /// Receives what the socket has now where `sink` wants to have it, up to `most` bytes, and
    /// returns how much that was; nothing when `sink` has to take it. After awaitPlainBytes.
    std::optional<std::size_t> fillNow(std::size_t most, BodySink &sink);
    void interrupt();

    /// True once per request whose sender waits to be told that its body is wanted.
    [[nodiscard]] bool peerAwaitsContinue();
    /// Bytes of the body not read yet; the largest number when that is not known, or when the peer
    /// may decide not to send them.
    [[nodiscard]] std::uint64_t restOfBody() const;
    [[nodiscard]] bool keepAlive() const;
    [[nodiscard]] bool peerTakesChunks() const;
    [[nodiscard]] bool hasBufferedBytes() const;

private:
    struct State;
    Task<std::size_t> readPlain(std::span<char> into);
    Task<std::size_t> readChunked(std::span<char> into);
    [[nodiscard]] std::size_t receiveNow(std::span<char> into);

    std::unique_ptr<State> m_state;
};

} // namespace pelliko::server
