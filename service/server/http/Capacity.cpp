#include "http/Capacity.h"

#include <sys/resource.h>

#include <algorithm>

namespace pelliko::server
{
namespace
{

/// A bound on memory: an idle connection takes about ten kilobytes.
constexpr std::size_t mostConnections = 12000;
/// The database, the listener, the pool.
constexpr std::size_t otherDescriptors = 64;

std::size_t raiseDescriptorLimit()
{
    rlimit limit{};
    if (getrlimit(RLIMIT_NOFILE, &limit) != 0)
        return 1024;
    rlimit raised = limit;
    raised.rlim_cur = raised.rlim_max;
    if (setrlimit(RLIMIT_NOFILE, &raised) == 0)
        limit = raised;
    return static_cast<std::size_t>(limit.rlim_cur);
}

} // namespace

Capacity claimCapacity()
{
    const std::size_t descriptors = std::max(raiseDescriptorLimit(), 2 * otherDescriptors);
    // An upload or a download has a file open beside its socket.
    const std::size_t connections = std::min(mostConnections, (descriptors - otherDescriptors) / 2);
    return {connections, connections * 5 / 6};
}

} // namespace pelliko::server
