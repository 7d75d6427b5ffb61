#include "accounts/AttemptLimiter.h"

#include <boost/asio/ip/address.hpp>

#include <algorithm>
#include <iterator>
#include <stdexcept>

namespace pelliko::server
{
namespace
{

namespace ip = boost::asio::ip;

/// Beyond so many addresses at a time the rest share one count: memory stays bounded.
constexpr std::size_t mostAddresses = 10000;
constexpr std::size_t homeBytes = 8;

std::optional<ip::address> parse(const std::string &text)
{
    const auto first = text.find_first_not_of(' ');
    const auto last = text.find_last_not_of(' ');
    if (first == std::string::npos)
        return std::nullopt;
    boost::system::error_code error;
    ip::address address = ip::make_address(text.substr(first, last - first + 1), error);
    if (error)
        return std::nullopt;
    if (address.is_v6() && address.to_v6().is_v4_mapped())
        return ip::make_address_v4(ip::v4_mapped, address.to_v6());
    return address;
}

std::string homeOf(const ip::address &address)
{
    if (address.is_v4())
        return address.to_string();
    auto bytes = address.to_v6().to_bytes();
    std::fill(std::next(bytes.begin(), homeBytes), bytes.end(), std::uint8_t{0});
    return ip::address_v6(bytes).to_string();
}

} // namespace

AttemptLimiter::Window &AttemptLimiter::windowOf(const std::string &address, Seconds now)
{
    const auto found = m_windows.find(address);
    if (found != m_windows.end())
        return found->second;
    if (m_windows.size() >= mostAddresses)
        std::erase_if(m_windows,
                      [&](const auto &entry) { return entry.second.start + m_window <= now; });
    return m_windows[m_windows.size() >= mostAddresses ? std::string() : address];
}

std::optional<Seconds> AttemptLimiter::attempt(const std::string &address, Seconds now)
{
    Window &window = windowOf(address, now);
    // A clock that was set back starts afresh instead of locking everybody out.
    if (window.count == 0 || window.start + m_window <= now || window.start > now)
        window = {now, 0};
    if (window.count >= m_limit)
        return window.start + m_window - now;
    ++window.count;
    return std::nullopt;
}

std::string normalAddress(const std::string &text)
{
    const auto address = parse(text);
    if (!address)
        throw std::invalid_argument("\"" + text + "\" is not an IP address");
    return address->to_string();
}

std::string addressOf(const Request &request, const std::vector<std::string> &proxies)
{
    const auto peer = parse(request.peer);
    if (!peer)
        return {};
    const std::string *forwarded = request.header("X-Forwarded-For");
    const bool isProxy = peer->is_loopback() || std::find(proxies.begin(), proxies.end(),
                                                          peer->to_string()) != proxies.end();
    if (!isProxy || forwarded == nullptr)
        return homeOf(*peer);
    // What stands before the last comma came from outside and may say anything.
    const auto comma = forwarded->rfind(',');
    const auto client =
        parse(comma == std::string::npos ? *forwarded : forwarded->substr(comma + 1));
    return homeOf(client ? *client : *peer);
}

} // namespace pelliko::server
