#pragma once

#include "http/Message.h"

#include <boost/asio/awaitable.hpp>

#include <cstddef>
#include <cstdint>
#include <exception>
#include <functional>
#include <optional>
#include <span>
#include <string>
#include <string_view>

namespace pelliko::server
{

/// A coroutine of the server. Debian 12's compiler makes code that crashes of a co_await in the
/// condition of an if, while or switch, and none at all of one with a braced list in its
/// expression: give what was awaited, or is passed, a name first.
template <class T> using Task = boost::asio::awaitable<T>;

/// The peer is gone, or was too slow: there is nobody to answer.
class Disconnected : public std::exception
{
public:
    [[nodiscard]] const char *what() const noexcept override { return "connection lost"; }
};

/// Somebody else ended the reading of this body (see Exchange::interrupt); the peer is still there.
class Interrupted : public std::exception
{
public:
    [[nodiscard]] const char *what() const noexcept override { return "interrupted"; }
};

/// Where the bytes of a body go.
class BodySink
{
public:
    /// Puts bytes at the beginning of a room and returns how many; 0 when there are none now.
    using Filler = std::function<std::size_t(std::span<char> room)>;

    virtual ~BodySink() = default;

    /// Takes a piece, which is gone after the call. On a thread of the pool; may wait.
    virtual void take(std::string_view piece) = 0;

    /// Has `fill` put the next bytes where they are to stay, and returns how many it was; nothing,
    /// and `fill` is not called, where the next bytes have to be taken. On the network thread; does
    /// not wait. Throws what `fill` throws.
    virtual std::optional<std::size_t> fillNow(const Filler & /*fill*/) { return std::nullopt; }
};

/// What went over the wire for one request so far.
struct Traffic {
    /// Of the answer; 0 as long as there is none.
    int status = 0;
    /// Bytes of the two bodies, without what frames them.
    std::uint64_t received = 0;
    std::uint64_t sent = 0;
};

/// One request and its answer. Used on the network thread only.
class Exchange
{
public:
    virtual ~Exchange() = default;

    [[nodiscard]] virtual const Request &request() const = 0;

    /// Reads some bytes of the body into `into`; 0 at its end. Answers a wait for "100 Continue".
    /// Throws Disconnected or Interrupted.
    virtual Task<std::size_t> readBody(std::span<char> into) = 0;

    /// Gives bytes of the body to `sink` as long as more are there and until it has `most`. Returns
    /// how many; 0 at the body's end. Throws as readBody does, and what `sink` throws.
    virtual Task<std::size_t> takeBody(std::size_t most, BodySink &sink) = 0;

    /// Ends a running readBody or takeBody, and every later one, with Interrupted. An answer can
    /// still be sent.
    virtual void interrupt() = 0;

    /// Sends a whole answer. For HEAD the body is left out and its length stays.
    virtual Task<void> respond(Response response) = 0;

    /// Sends the head of a streamed answer; without a length it goes out in chunks.
    /// For HEAD the following writes send nothing.
    virtual Task<void> startStream(Response head, std::optional<std::uint64_t> length) = 0;
    virtual Task<void> write(std::string_view bytes) = 0;
    /// Sends `length` bytes of an open file from `offset`; the kernel copies them.
    virtual Task<void> sendFile(int file, std::uint64_t offset, std::uint64_t length) = 0;
    virtual Task<void> endStream() = 0;

    /// Calls `gone` once when the peer closes its side while nothing is read or written; an empty
    /// function ends the watch. Not told of a peer that has sent a further request already.
    virtual void watchPeer(std::function<void()> gone) = 0;

    /// True once a head was sent: a refusal can no longer be told.
    [[nodiscard]] bool answered() const { return traffic().status != 0; }
    [[nodiscard]] virtual Traffic traffic() const = 0;
};

/// Reads a whole body of at most `limit` bytes; more is refused as too large.
Task<std::string> readWholeBody(Exchange &exchange, std::size_t limit);

} // namespace pelliko::server
