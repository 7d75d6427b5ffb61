#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace pelliko::server
{

/// One header line; names compare without regard to case.
struct Header {
    std::string name;
    std::string value;
};

/// The statuses of answers that are no refusals; those of refusals stand in the table of Errors.
enum class Status {
    ok = 200,
    created = 201,
    noContent = 204,
    partialContent = 206,
    notModified = 304,
    temporaryRedirect = 307,
};

/// A request's head, read completely; the body is read through the Exchange.
struct Request {
    std::string method;
    /// Without the query, not decoded: every address of this server is plain ASCII.
    std::string path;
    std::vector<Header> headers;
    /// The address that the connection comes from; empty when it is gone already.
    std::string peer;
    /// Bytes of the body; absent when they come in chunks of unknown total.
    std::optional<std::uint64_t> bodyLength;

    /// The first header of this name, or null.
    [[nodiscard]] const std::string *header(std::string_view name) const;
};

/// An answer with its whole body, or the head of one whose body is streamed.
struct Response {
    int status = 200;
    std::vector<Header> headers;
    std::string body;
};

/// The words after the status number; "Status" for a number that this server never sends.
[[nodiscard]] const char *reasonPhrase(int status);

/// Compares ASCII texts without regard to case.
[[nodiscard]] bool equalsIgnoringCase(std::string_view left, std::string_view right);

[[nodiscard]] Response makeResponse(Status status, std::vector<Header> headers = {},
                                    std::string body = {});

/// 200 or 201 with a JSON body that nothing may keep.
[[nodiscard]] Response jsonResponse(Status status, std::string json);

} // namespace pelliko::server
