#include "tus/TusHeaders.h"

#include "http/Errors.h"
#include "text/Base64.h"

#include <charconv>

namespace pelliko::server
{
namespace
{

std::string_view trimmed(std::string_view text)
{
    const auto first = text.find_first_not_of(" \t");
    if (first == std::string_view::npos)
        return {};
    return text.substr(first, text.find_last_not_of(" \t") - first + 1);
}

} // namespace

void checkTusVersion(const Request &request)
{
    const std::string *version = request.header("Tus-Resumable");
    if (version == nullptr || *version != tusVersion)
        throw Refusal(Error::unsupportedTusVersion, {}, {{"Tus-Version", tusVersion}});
}

std::string tusMethod(const Request &request)
{
    const std::string *instead = request.header("X-HTTP-Method-Override");
    return instead == nullptr ? request.method : *instead;
}

std::optional<std::uint64_t> parseNumber(std::string_view text)
{
    std::uint64_t number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    if (error != std::errc() || end != text.data() + text.size())
        return std::nullopt;
    return number;
}

std::uint64_t requiredNumber(const Request &request, const char *name)
{
    const std::string *value = request.header(name);
    const auto number = value == nullptr ? std::nullopt : parseNumber(*value);
    if (!number)
        throw Refusal(Error::badRequest, std::string(name) + " is missing or not a number.");
    return *number;
}

std::map<std::string, std::string> parseUploadMetadata(std::string_view value)
{
    std::map<std::string, std::string> metadata;
    while (!value.empty()) {
        const auto comma = value.find(',');
        const std::string_view pair = trimmed(value.substr(0, comma));
        value = comma == std::string_view::npos ? std::string_view() : value.substr(comma + 1);
        const auto space = pair.find_first_of(" \t");
        const auto decoded =
            base64Decode(space == std::string_view::npos ? "" : trimmed(pair.substr(space + 1)));
        const std::string key(pair.substr(0, space));
        if (key.empty() || !decoded || !metadata.emplace(key, *decoded).second)
            throw Refusal(Error::badRequest, "Upload-Metadata is malformed.");
    }
    return metadata;
}

void checkContentType(const Request &request)
{
    const std::string *type = request.header("Content-Type");
    if (type == nullptr || !equalsIgnoringCase(*type, "application/offset+octet-stream"))
        throw Refusal(Error::unsupportedMediaType);
}

} // namespace pelliko::server
