#include "RecordLine.h"

#include <cstring>

#include <nlohmann/json.hpp>

namespace pelliko::velmora
{
namespace
{
constexpr const char *keys[] = {"app_id", "feature", "extra", "value"};

// What follows scheme and authority.
const char *pathOf(const char *uri)
{
    const char *authority = std::strstr(uri, "://");
    return authority ? std::strchr(authority + 3, '/') : nullptr;
}

std::string utc(std::time_t time)
{
    std::tm parts{};
    gmtime_r(&time, &parts);
    char text[32];
    std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%SZ", &parts);
    return text;
}

// The number of keys taken over.
int takeKeys(bundle *data, nlohmann::ordered_json &record)
{
    int taken = 0;
    for (const char *key : keys) {
        char *text = nullptr;
        if (bundle_get_str(data, key, &text) == BUNDLE_ERROR_NONE) {
            record[key] = text;
            ++taken;
        }
    }
    return taken;
}
} // namespace

std::optional<std::string> recordLine(const char *uri, bundle *data, std::time_t now)
{
    const char *path = pathOf(uri);
    if (!path) {
        return std::nullopt;
    }
    nlohmann::ordered_json record;
    record["time"] = utc(now);
    record["uri"] = path;
    const int taken = takeKeys(data, record);
    if (taken == 0 || taken != bundle_get_count(data)) {
        return std::nullopt;
    }
    return record.dump(-1, ' ', false, nlohmann::json::error_handler_t::replace) + "\n";
}

} // namespace pelliko::velmora
