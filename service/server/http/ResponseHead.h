#pragma once

#include "http/Message.h"

#include <cstdint>
#include <optional>
#include <string>

namespace pelliko::server
{

/// How an answer's body is framed.
struct Framing {
    bool keepAlive = true;
    /// Absent: in chunks, or until the connection closes when `chunked` is false.
    std::optional<std::uint64_t> length;
    bool chunked = false;
};

/// The bytes of an answer's head, its empty line included. Every answer gets the headers that keep
/// a browser from guessing, framing or telling where it came from. Line breaks cannot enter a
/// value.
[[nodiscard]] std::string responseHead(const Response &response, const Framing &framing,
                                       std::int64_t now);

} // namespace pelliko::server
