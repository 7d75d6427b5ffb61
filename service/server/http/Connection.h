#pragma once

#include "http/Exchange.h"
#include "http/StoragePool.h"

#include <boost/asio/ip/tcp.hpp>

#include <chrono>
#include <functional>
#include <memory>

namespace pelliko::server
{

/// How long the server waits for a peer that does nothing.
struct Timeouts {
    /// For the first byte of a request on an open connection.
    std::chrono::seconds idle{75};
    /// For a whole request head, from its first byte: no head takes longer, however it trickles.
    std::chrono::seconds head{15};
    /// For the next bytes of a body, in either direction.
    std::chrono::seconds progress{60};
    /// For what a peer still sends after its last answer.
    std::chrono::seconds linger{5};
    /// For the first request on a connection once the server is about to end: it may be on its way.
    std::chrono::seconds firstWords{1};
};

/// One client connection: reads heads, gives each request to the handler, keeps the order of
/// pipelined requests. Network thread only.
class Connection
{
public:
    using Handler = std::function<Task<void>(Exchange &)>;
    /// Told of heads that cannot be read: answers with a refusal.
    using HeadRefused = std::function<Response(bool tooLarge)>;

    virtual ~Connection() = default;

    /// Serves until either side closes; keeps the connection alive meanwhile. Throws nothing.
    virtual Task<void> run() = 0;

    /// Closes when the request in hand, or the first that is on its way, is answered; soon when
    /// there is none.
    virtual void finish() = 0;
    /// Closes now; a running body ends as with a lost peer.
    virtual void cut() = 0;

    static std::shared_ptr<Connection> make(boost::asio::ip::tcp::socket socket,
                                            const Timeouts &timeouts, StoragePool &pool,
                                            Handler handler, HeadRefused headRefused);
};

} // namespace pelliko::server
