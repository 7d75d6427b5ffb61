#pragma once

#include "Config.h"
#include "store/Blobs.h"
#include "store/Metadata.h"
#include "store/Peers.h"

#include <functional>
#include <memory>
#include <string>

namespace pelliko::server
{

/// The running server: listens, serves, sweeps. One thread calls `run`.
class Server
{
public:
    /// How many calls of the metadata it makes at once, and the least that it makes of the blobs.
    static constexpr std::size_t storageThreads = 8;

    /// Starts to listen; throws std::exception with a sentence when that fails. The stores outlive
    /// the server. `now` gives seconds since the epoch; without `peers` it has the stores for
    /// itself.
    Server(const Config &config, Metadata &metadata, Blobs &blobs, std::function<Seconds()> now,
           std::unique_ptr<Peers> peers = nullptr);
    ~Server();

    /// "http://host:port", with the port that was picked.
    [[nodiscard]] std::string url() const;

    /// Likewise for what monitors ask; empty when they may not.
    [[nodiscard]] std::string monitoringUrl() const;

    /// Serves until stopped; then lets requests in hand end, for some seconds.
    void run();

    /// Ends `run` as SIGTERM does. Any thread.
    void stop();
    /// Looks for what has expired now. Any thread; for a clock that jumps.
    void sweep();

private:
    struct State;
    std::unique_ptr<State> m_state;
};

} // namespace pelliko::server
