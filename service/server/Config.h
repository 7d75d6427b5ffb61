#pragma once

#include "http/Connection.h"
#include "shares/Limits.h"
#include "store/OpenStores.h"

#include <chrono>
#include <cstdint>
#include <string>
#include <vector>

namespace pelliko::server
{

/// What `serve` was asked to do.
struct Config {
    /// An IPv4 address, or an IPv6 one in brackets, a colon and a port; port 0 picks a free one.
    std::string listen = "127.0.0.1:8080";
    StoreUrls stores;
    /// What links start with; empty for the address that is listened on.
    std::string publicUrl;
    /// Where monitors ask, in the form of `listen`; empty for nowhere.
    std::string monitoring;
    /// IP addresses of proxies on other machines that are believed on whom they ask for.
    std::vector<std::string> trustedProxies;
    Limits limits;
    Timeouts timeouts;
    /// How long requests in hand may take to end once the server was asked to.
    std::chrono::seconds drain{10};
    /// Where the line with the server's address goes once it accepts connections; -1 for nowhere.
    int readyFd = -1;
};

struct ListenAddress {
    std::string host;
    std::uint16_t port = 0;
};

/// Splits "host:port"; throws std::invalid_argument with a sentence.
[[nodiscard]] ListenAddress parseListenAddress(const std::string &text);

/// The public URL without slashes at its end; throws std::invalid_argument for what is no http
/// address.
[[nodiscard]] std::string normalPublicUrl(std::string url);

} // namespace pelliko::server
