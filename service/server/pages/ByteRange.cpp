#include "pages/ByteRange.h"

#include "http/Message.h"
#include "tus/TusHeaders.h"

#include <algorithm>

namespace pelliko::server
{
namespace
{

ByteRange part(std::uint64_t first, std::uint64_t last)
{
    return {ByteRange::Kind::part, first, last - first + 1};
}

} // namespace

ByteRange parseRange(std::string_view header, std::uint64_t size)
{
    const ByteRange whole{ByteRange::Kind::whole, 0, size};
    const ByteRange unsatisfiable{ByteRange::Kind::unsatisfiable, 0, 0};
    constexpr std::string_view unit = "bytes=";
    if (!equalsIgnoringCase(header.substr(0, unit.size()), unit))
        return whole;
    header.remove_prefix(unit.size());
    const auto dash = header.find('-');
    if (dash == std::string_view::npos)
        return whole;
    const auto first = parseNumber(header.substr(0, dash));
    const auto last = parseNumber(header.substr(dash + 1));
    const bool openEnd = dash + 1 == header.size();
    if (dash == 0) {
        if (!last)
            return whole;
        return *last == 0 || size == 0 ? unsatisfiable
                                       : part(size - std::min(*last, size), size - 1);
    }
    if (!first || (!last && !openEnd) || (last && *last < *first))
        return whole;
    if (*first >= size)
        return unsatisfiable;
    return part(*first, openEnd ? size - 1 : std::min(*last, size - 1));
}

} // namespace pelliko::server
