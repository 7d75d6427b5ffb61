#include "Config.h"

#include "tus/TusHeaders.h"

#include <limits>
#include <stdexcept>

namespace pelliko::server
{

ListenAddress parseListenAddress(const std::string &text)
{
    const auto colon = text.rfind(':');
    const auto port =
        colon == std::string::npos ? std::nullopt : parseNumber(text.substr(colon + 1));
    if (!port || *port > std::numeric_limits<std::uint16_t>::max())
        throw std::invalid_argument("\"" + text + "\" is not an address like 127.0.0.1:8080");
    std::string host = text.substr(0, colon);
    if (host.size() > 2 && host.front() == '[' && host.back() == ']')
        host = host.substr(1, host.size() - 2);
    if (host.empty())
        throw std::invalid_argument("\"" + text + "\" lacks the address before the port");
    return {host, static_cast<std::uint16_t>(*port)};
}

std::string normalPublicUrl(std::string url)
{
    while (!url.empty() && url.back() == '/')
        url.pop_back();
    const bool isHttp = url.rfind("http://", 0) == 0 || url.rfind("https://", 0) == 0;
    if (!url.empty() && !isHttp)
        throw std::invalid_argument("\"" + url + "\" is not an http or https address");
    return url;
}

} // namespace pelliko::server
