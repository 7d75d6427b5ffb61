#pragma once

#include "http/Message.h"
#include "store/Metadata.h"

#include <cstddef>
#include <map>
#include <optional>
#include <string>
#include <vector>

namespace pelliko::server
{

/// Counts how often each address tried something that is worth guessing. Kept in memory only: no
/// address is ever written down. Network thread only.
class AttemptLimiter
{
public:
    /// `limit` attempts in `window` seconds from the first one on.
    AttemptLimiter(std::size_t limit, Seconds window) : m_limit(limit), m_window(window) {}

    /// Counts an attempt; seconds to wait when the address has no more of them.
    std::optional<Seconds> attempt(const std::string &address, Seconds now);

private:
    struct Window {
        Seconds start = 0;
        std::size_t count = 0;
    };
    Window &windowOf(const std::string &address, Seconds now);

    std::size_t m_limit;
    Seconds m_window;
    std::map<std::string, Window> m_windows;
};

/// Whom an attempt is counted for: the peer, or whom a proxy names last in X-Forwarded-For. Proxies
/// are those on this machine and those of `proxies`, in the form of normalAddress. A home's IPv6
/// addresses count as one.
[[nodiscard]] std::string addressOf(const Request &request,
                                    const std::vector<std::string> &proxies = {});

/// An IP address in the one form that it is compared in; throws std::invalid_argument with a
/// sentence.
[[nodiscard]] std::string normalAddress(const std::string &text);

} // namespace pelliko::server
