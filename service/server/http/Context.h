#pragma once

#include "accounts/AttemptLimiter.h"
#include "http/StoragePool.h"
#include "monitoring/Metrics.h"
#include "push/PushHub.h"
#include "shares/Limits.h"
#include "store/Blobs.h"
#include "store/Metadata.h"
#include "store/Peers.h"
#include "tus/ActiveWrites.h"

#include <functional>
#include <string>
#include <vector>

namespace pelliko::server
{

/// What every endpoint works with. Lives as long as the server.
struct Context {
    Metadata &metadata;
    Blobs &blobs;
    Peers &peers;
    /// For calls of the metadata; as many threads as the database has sessions for, so that none
    /// waits for one.
    StoragePool &pool;
    /// For calls of the blobs, which may take long: nobody who only asks the metadata waits behind.
    StoragePool &blobPool;
    ActiveWrites &writes;
    PushHub &pushes;
    Limits limits;
    /// Seconds since the epoch.
    std::function<Seconds()> now;
    /// What links start with: scheme, host, no slash at the end.
    std::string publicUrl;
    /// Addresses of proxies on other machines, whose word on whom they ask for is taken.
    std::vector<std::string> proxies{};
    /// What is true of the server now.
    std::function<Levels()> levels{};
    /// To be told of a blob that this server has written to without knowing the end of it.
    std::function<void(const std::string &blob)> doubt{};
    Metrics metrics{};
    AttemptLimiter registrations{limits.registrations, limits.registrationWindow};
};

} // namespace pelliko::server
