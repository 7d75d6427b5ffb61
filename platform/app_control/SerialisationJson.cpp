#include "Handle.h"
#include "Serialisation.h"

#include <nlohmann/json.hpp>

namespace pelliko::platform
{

namespace
{

using Json = nlohmann::json;

Json jsonOf(const TextArray &array)
{
    Json list = Json::array();
    for (const auto &text : array)
        list.push_back(text ? Json(*text) : Json(nullptr));
    return list;
}

Json jsonOfExtras(const app_control_s &request)
{
    Json extras = Json::object();
    for (const auto &[key, extra] : request.extras) {
        const auto *text = std::get_if<std::string>(&extra);
        extras[key] = text ? Json(*text) : jsonOf(std::get<TextArray>(extra));
    }
    return extras;
}

void add(Json &object, const char *key, const std::optional<std::string> &value)
{
    if (value)
        object[key] = *value;
}

// Replaces what is not UTF-8 instead of throwing.
std::string printed(const Json &json)
{
    return json.dump(-1, ' ', false, Json::error_handler_t::replace);
}

} // namespace

std::string extrasToJson(app_control_h request)
{
    return request ? printed(jsonOfExtras(*request)) : "{}";
}

std::string toJson(app_control_h request)
{
    Json object = Json::object();
    if (request) {
        add(object, "operation", request->operation);
        add(object, "uri", request->uri);
        add(object, "mime", request->mime);
        add(object, "app_id", request->appId);
        object["extras"] = jsonOfExtras(*request);
    }
    return printed(object);
}

} // namespace pelliko::platform
