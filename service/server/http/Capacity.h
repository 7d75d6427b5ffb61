// How many connections the process can carry
#pragma once

#include <cstddef>

namespace pelliko::server
{

struct Capacity {
    /// Beyond this, callers wait in the system's queue until somebody leaves.
    std::size_t connections = 0;
    /// Of these, as many push streams at most: they stay, so the others need room of their own.
    std::size_t pushStreams = 0;
};

/// Raises the process's limit of open descriptors as far as it may, and tells what fits into it.
[[nodiscard]] Capacity claimCapacity();

} // namespace pelliko::server
