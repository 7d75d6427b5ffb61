#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace pelliko::server
{

/// Text for the inside of an element or of a quoted attribute.
[[nodiscard]] std::string htmlEscape(std::string_view text);

/// The value of Content-Disposition for a download under this name: a plain ASCII form for old
/// browsers and the exact UTF-8 one, neither of which can end the header line or the quotes.
[[nodiscard]] std::string attachmentDisposition(std::string_view name);

/// True for well-formed UTF-8 (no surrogates, no overlong forms).
[[nodiscard]] bool isUtf8(std::string_view text);

/// "HTTP date" of RFC 9110, always in GMT.
[[nodiscard]] std::string httpDate(std::int64_t secondsSinceEpoch);

/// For a person: "21 November 2025, 14:05 UTC".
[[nodiscard]] std::string readableDate(std::int64_t secondsSinceEpoch);

/// For a program inside a page: "2025-11-21T14:05:09Z".
[[nodiscard]] std::string isoDate(std::int64_t secondsSinceEpoch);

/// For a person: "1 byte", "999 bytes", "1.5 kB", "12 MB"; decimal units.
[[nodiscard]] std::string readableSize(std::uint64_t bytes);

} // namespace pelliko::server
