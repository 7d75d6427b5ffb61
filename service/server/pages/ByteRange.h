#pragma once

#include <cstdint>
#include <string_view>

namespace pelliko::server
{

/// What a Range header asks of a file of a known size.
struct ByteRange {
    enum class Kind { whole, part, unsatisfiable };
    Kind kind = Kind::whole;
    std::uint64_t offset = 0;
    std::uint64_t length = 0;
};

/// Reads "bytes=a-b", "bytes=a-" and "bytes=-n". Several ranges, other units and malformed headers
/// ask for the whole file, as the standard allows.
[[nodiscard]] ByteRange parseRange(std::string_view header, std::uint64_t size);

} // namespace pelliko::server
