#include "push/PushJson.h"

#include "http/Errors.h"
#include "tus/TusHeaders.h"

#include <nlohmann/json.hpp>

#include <limits>

namespace pelliko::server
{
namespace
{

using nlohmann::json;
constexpr auto highestId = std::uint64_t{std::numeric_limits<std::int64_t>::max()};

} // namespace

std::optional<std::int64_t> parsePushId(std::string_view text)
{
    const auto number = parseNumber(text);
    if (!number || *number > highestId)
        return std::nullopt;
    return static_cast<std::int64_t>(*number);
}

std::int64_t parseAcknowledged(std::string_view text)
{
    const json body = json::parse(text, nullptr, false);
    const auto upTo = body.find("up_to");
    if (upTo == body.end() || !upTo->is_number_unsigned() || upTo->get<std::uint64_t>() > highestId)
        throw Refusal(Error::badRequest, "The member \"up_to\" is missing or malformed.");
    return upTo->get<std::int64_t>();
}

std::string eventsOf(const std::vector<Push> &pushes)
{
    std::string events;
    for (const Push &push : pushes) {
        const json data{{"content_token", push.contentToken}};
        events +=
            "id: " + std::to_string(push.id) + "\nevent: share\ndata: " + data.dump() + "\n\n";
    }
    return events;
}

} // namespace pelliko::server
