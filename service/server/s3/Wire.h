#pragma once

#include "s3/Signature.h"

#include <cstddef>
#include <ctime>
#include <memory>
#include <mutex>
#include <optional>
#include <span>
#include <stdexcept>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace pelliko::server::s3
{

/// The request did not get a whole answer: the same again may.
class TransportFailure : public std::runtime_error
{
    using std::runtime_error::runtime_error;
};

struct WireRequest {
    std::string method;
    std::string url;
    Pairs headers;
    /// Has to stay until the answer is there.
    std::string_view body;
};

struct WireAnswer {
    int status = 0;
    /// Names in small letters.
    Pairs headers;
    std::string body;

    /// The header's value, or an empty text.
    [[nodiscard]] std::string header(std::string_view name) const;
    /// When the other side says it was sent, in seconds since the epoch.
    [[nodiscard]] std::optional<std::time_t> time() const;
};

/// A connection to the store that is kept from one request to the next. One thread at a time.
class Wire
{
public:
    /// `caFile` may be empty.
    explicit Wire(const std::string &caFile);
    ~Wire();
    Wire(const Wire &) = delete;
    Wire &operator=(const Wire &) = delete;

    /// Sends the request and waits for its whole answer. Throws TransportFailure.
    WireAnswer run(const WireRequest &request);

    /// Sends the request and waits for its answer's head; the body follows with `read`. The body of
    /// a refusal is in the answer. Throws TransportFailure.
    WireAnswer begin(const WireRequest &request);
    /// Bytes of the body, 0 at its end; what is not read waits in the network, but for a little.
    /// Throws TransportFailure.
    std::size_t read(std::span<char> into);
    /// Gives up what is under way; a connection in the middle of an answer is closed.
    void stop();

private:
    struct State;
    std::unique_ptr<State> m_state;
};

/// Connections that wait for their next request. Thread-safe.
class Wires : public std::enable_shared_from_this<Wires>
{
public:
    explicit Wires(std::string caFile) : m_caFile(std::move(caFile)) {}

    /// One that nobody uses; it comes back by itself.
    std::shared_ptr<Wire> take();

private:
    void give(std::unique_ptr<Wire> wire);

    std::string m_caFile;
    std::mutex m_mutex;
    std::vector<std::unique_ptr<Wire>> m_idle;
};

} // namespace pelliko::server::s3
