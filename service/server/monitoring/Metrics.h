// What a server counts about itself, for those who run it
#pragma once

#include "store/StorageFailure.h"

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>

namespace pelliko::server
{

/// What a request was about; several addresses share one, so that there are few time series.
enum class Endpoint { api, upload, push, page, download, other };

/// Tells what a request's path is about. A path that nothing answers is `other`.
[[nodiscard]] Endpoint endpointOf(const std::string &path);

/// What is true at one moment.
struct Levels {
    std::size_t connections = 0;
    std::size_t pushStreams = 0;
    std::size_t uploads = 0;
    /// Calls handed to the storage threads that have not returned.
    std::size_t storageCalls = 0;
    bool draining = false;
};

/// The counters of one process, from its start. Any thread.
class Metrics
{
public:
    Metrics();
    ~Metrics();
    Metrics(const Metrics &) = delete;
    Metrics &operator=(const Metrics &) = delete;

    /// A request has ended. `status` is 0 when its peer was gone before an answer.
    void requestEnded(Endpoint endpoint, int status, std::chrono::duration<double> took);
    /// Bytes of bodies that came from, or went to, clients.
    void transferred(std::uint64_t received, std::uint64_t sent);
    /// A request was refused because a store failed.
    void storageFailed(StorageFailure::Kind kind);
    void blobsRemoved(std::size_t count);

    /// Everything in the text format of Prometheus.
    [[nodiscard]] std::string text(const Levels &now);

private:
    struct Families;
    std::unique_ptr<Families> m_families;
};

} // namespace pelliko::server
