#pragma once

#include "accounts/AttemptLimiter.h"
#include "http/StoragePool.h"
#include "push/PushHub.h"
#include "shares/Limits.h"
#include "store/Blobs.h"
#include "store/Metadata.h"
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
    StoragePool &pool;
    ActiveWrites &writes;
    PushHub &pushes;
    Limits limits;
    /// Seconds since the epoch.
    std::function<Seconds()> now;
    /// What links start with: scheme, host, no slash at the end.
    std::string publicUrl;
    /// Called when bytes became unneeded or a deadline was set.
    std::function<void()> wakeSweeper;
    /// Called when these accounts have new pushes, or another token than before. With several
    /// servers on one store this is where each tells the others.
    std::function<void(const std::vector<std::int64_t> &)> announcePushes;
    AttemptLimiter registrations{limits.registrations, limits.registrationWindow};
};

} // namespace pelliko::server
