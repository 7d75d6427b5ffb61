#include "http/ResponseHead.h"

#include "text/Escape.h"

#include <algorithm>

namespace pelliko::server
{
namespace
{

constexpr const char *commonHeaders = "X-Content-Type-Options: nosniff\r\n"
                                      "X-Frame-Options: DENY\r\n"
                                      "Referrer-Policy: no-referrer\r\n"
                                      "X-Robots-Tag: noindex, nofollow\r\n";
/// For answers that bring no policy of their own: nothing in them may run or load.
constexpr const char *strictPolicy =
    "Content-Security-Policy: default-src 'none'; frame-ancestors 'none'; sandbox\r\n";

void addHeader(std::string &head, const Header &header)
{
    head += header.name + ": ";
    std::copy_if(header.value.begin(), header.value.end(), std::back_inserter(head),
                 [](char c) { return c != '\r' && c != '\n' && c != '\0'; });
    head += "\r\n";
}

bool hasBody(int status)
{
    return status >= 200 && status != 204 && status != 304;
}

} // namespace

std::string responseHead(const Response &response, const Framing &framing, std::int64_t now)
{
    std::string head = "HTTP/1.1 " + std::to_string(response.status) + " " +
                       reasonPhrase(response.status) + "\r\nDate: " + httpDate(now) + "\r\n";
    bool hasPolicy = false;
    for (const Header &header : response.headers) {
        addHeader(head, header);
        hasPolicy = hasPolicy || equalsIgnoringCase(header.name, "Content-Security-Policy");
    }
    head += commonHeaders;
    if (!hasPolicy)
        head += strictPolicy;
    if (framing.chunked)
        head += "Transfer-Encoding: chunked\r\n";
    else if (framing.length && hasBody(response.status))
        head += "Content-Length: " + std::to_string(*framing.length) + "\r\n";
    head += framing.keepAlive ? "Connection: keep-alive\r\n\r\n" : "Connection: close\r\n\r\n";
    return head;
}

} // namespace pelliko::server
