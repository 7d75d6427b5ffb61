#include "http/Message.h"

#include <algorithm>
#include <utility>

namespace pelliko::server
{
namespace
{

struct Phrase {
    int status;
    const char *text;
};

constexpr Phrase phrases[] = {
    {100, "Continue"},
    {200, "OK"},
    {201, "Created"},
    {204, "No Content"},
    {206, "Partial Content"},
    {304, "Not Modified"},
    {307, "Temporary Redirect"},
    {400, "Bad Request"},
    {401, "Unauthorized"},
    {404, "Not Found"},
    {405, "Method Not Allowed"},
    {409, "Conflict"},
    {410, "Gone"},
    {412, "Precondition Failed"},
    {413, "Content Too Large"},
    {415, "Unsupported Media Type"},
    {416, "Range Not Satisfiable"},
    {429, "Too Many Requests"},
    {431, "Request Header Fields Too Large"},
    {500, "Internal Server Error"},
    {503, "Service Unavailable"},
    {507, "Insufficient Storage"},
};

char lower(char c)
{
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

} // namespace

bool equalsIgnoringCase(std::string_view left, std::string_view right)
{
    return std::equal(left.begin(), left.end(), right.begin(), right.end(),
                      [](char a, char b) { return lower(a) == lower(b); });
}

const std::string *Request::header(std::string_view name) const
{
    auto found = std::find_if(headers.begin(), headers.end(),
                              [&](const Header &h) { return equalsIgnoringCase(h.name, name); });
    return found == headers.end() ? nullptr : &found->value;
}

const char *reasonPhrase(int status)
{
    for (const Phrase &phrase : phrases) {
        if (phrase.status == status)
            return phrase.text;
    }
    return "Status";
}

Response makeResponse(Status status, std::vector<Header> headers, std::string body)
{
    return Response{static_cast<int>(status), std::move(headers), std::move(body)};
}

Response jsonResponse(Status status, std::string json)
{
    return makeResponse(status,
                        {{"Content-Type", "application/json"}, {"Cache-Control", "no-store"}},
                        std::move(json));
}

} // namespace pelliko::server
