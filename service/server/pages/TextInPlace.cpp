#include "pages/TextInPlace.h"

#include "pages/FileKind.h"
#include "text/Escape.h"

#include <algorithm>
#include <string_view>

namespace pelliko::server
{
namespace
{

/// A page on a phone; whoever gets more saves it.
constexpr std::uint64_t mostBytes = 64 * 1024;
constexpr std::string_view byteOrderMark = "\xef\xbb\xbf";

bool isShown(char c)
{
    const auto byte = static_cast<unsigned char>(c);
    return byte >= 0x20 ? byte != 0x7f : c == '\n' || c == '\t';
}

} // namespace

const FileRecord *textInPlace(const ShareRecord &share)
{
    if (share.files.size() != 1)
        return nullptr;
    const FileRecord &file = share.files.front();
    const bool fits = file.size > 0 && file.size <= mostBytes;
    return fits && kindOf(file.name, file.type) == FileKind::text ? &file : nullptr;
}

std::optional<std::string> readableText(const std::string &bytes)
{
    if (!isUtf8(bytes))
        return std::nullopt;
    std::string_view rest = bytes;
    if (rest.substr(0, byteOrderMark.size()) == byteOrderMark)
        rest.remove_prefix(byteOrderMark.size());
    std::string text;
    std::copy_if(rest.begin(), rest.end(), std::back_inserter(text), isShown);
    return text;
}

} // namespace pelliko::server
