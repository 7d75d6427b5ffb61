#include "Json.h"

#include "Record.h"
#include "Serialisation.h"
#include "notification.h"

#include <nlohmann/json.hpp>

namespace pelliko::quickpanel_tool
{
namespace
{

using nlohmann::ordered_json;
using notification::Record;
using notification::Text;
using notification::Variant;

const char *const textNames[NOTIFICATION_TEXT_TYPE_MAX] = {"title", "content", "content_hidden",
                                                           "event_count", "info_1"};
const char *const imageNames[NOTIFICATION_IMAGE_TYPE_MAX] = {
    "icon", "indicator", "lock", "thumbnail", "thumbnail_lock", "icon_sub", "background"};

template <size_t count> std::string nameOf(const char *const (&names)[count], int kind)
{
    return kind >= 0 && kind < static_cast<int>(count) ? names[kind] : std::to_string(kind);
}

ordered_json valueJson(const Variant &value)
{
    if (g_variant_is_of_type(value.get(), G_VARIANT_TYPE_INT32))
        return g_variant_get_int32(value.get());
    if (g_variant_is_of_type(value.get(), G_VARIANT_TYPE_DOUBLE))
        return g_variant_get_double(value.get());
    if (g_variant_is_of_type(value.get(), G_VARIANT_TYPE_STRING))
        return g_variant_get_string(value.get(), nullptr);
    return nullptr;
}

ordered_json textJson(const Text &text)
{
    ordered_json json = {{"text", text.shown}, {"key", nullptr}, {"values", ordered_json::array()}};
    if (!text.key.empty())
        json["key"] = text.key;
    for (const auto &value : text.values)
        json["values"].push_back(valueJson(value));
    return json;
}

ordered_json shownText(const Record &record, int kind)
{
    const auto found = record.texts.find(kind);
    return found == record.texts.end() ? ordered_json() : ordered_json(found->second.shown);
}

ordered_json launchJson(const Record &record)
{
    if (!record.launch)
        return nullptr;
    const app_control_h request = platform::fromVariant(record.launch.get());
    const std::string text = platform::toJson(request);
    app_control_destroy(request);
    return ordered_json::parse(text);
}

std::string timeText(int64_t microseconds)
{
    GDateTime *seconds = g_date_time_new_from_unix_utc(microseconds / G_USEC_PER_SEC);
    gchar *text = g_date_time_format(seconds, "%Y-%m-%dT%H:%M:%S");
    char fraction[16];
    g_snprintf(fraction, sizeof fraction, ".%03dZ",
               static_cast<int>(microseconds % G_USEC_PER_SEC / 1000));
    std::string result = std::string(text) + fraction;
    g_free(text);
    g_date_time_unref(seconds);
    return result;
}

int64_t number(const Variant &dictionary, const char *key)
{
    gint64 value = 0;
    g_variant_lookup(dictionary.get(), key, "x", &value);
    return value;
}

std::string word(const Variant &dictionary, const char *key)
{
    const gchar *value = "";
    g_variant_lookup(dictionary.get(), key, "&s", &value);
    return value;
}

ordered_json notificationJson(const Variant &notification)
{
    const Record record = notification::recordFrom(notification.get());
    ordered_json texts = ordered_json::object();
    for (const auto &[kind, text] : record.texts)
        texts[nameOf(textNames, kind)] = textJson(text);
    ordered_json images = ordered_json::object();
    for (const auto &[kind, path] : record.images)
        images[nameOf(imageNames, kind)] = path;

    ordered_json json;
    json["id"] = record.id;
    json["app"] = record.app;
    json["tag"] = record.tag.empty() ? ordered_json() : ordered_json(record.tag);
    json["type"] = record.type;
    json["layout"] = record.layout;
    json["display"] = record.display;
    json["title"] = shownText(record, NOTIFICATION_TEXT_TYPE_TITLE);
    json["content"] = shownText(record, NOTIFICATION_TEXT_TYPE_CONTENT);
    json["progress"] = record.progress;
    json["texts"] = texts;
    json["images"] = images;
    json["launch"] = launchJson(record);
    json["input_time"] = record.time;
    json["sound"] = record.sound;
    return json;
}

ordered_json eventJson(const Variant &event)
{
    ordered_json json;
    json["seq"] = number(event, "seq");
    json["time"] = timeText(number(event, "at"));
    json["event"] = word(event, "event");
    if (json["event"] == "toast") {
        json["app"] = word(event, "app");
        json["message"] = word(event, "message");
        return json;
    }
    if (const int64_t replaced = number(event, "replaced"))
        json["replaced"] = replaced;
    json.update(notificationJson(event));
    return json;
}

std::string plain(const ordered_json &value)
{
    return value.is_null() ? "-" : value.is_string() ? value.get<std::string>() : value.dump();
}

std::string summary(const ordered_json &json)
{
    std::string line = plain(json["id"]) + "  " + plain(json["app"]) + "  tag " +
                       plain(json["tag"]) + "  " + plain(json["title"]);
    if (!json["content"].is_null())
        line += " | " + plain(json["content"]);
    return line;
}

std::string lineOf(const ordered_json &event)
{
    if (event["event"] == "toast")
        return plain(event["time"]) + "  toast   " + plain(event["message"]);
    return plain(event["time"]) + "  " + plain(event["event"]) + "  " + summary(event);
}

} // namespace

std::string notificationsJson(const std::vector<Variant> &notifications)
{
    ordered_json all = ordered_json::array();
    for (const Variant &notification : notifications)
        all.push_back(notificationJson(notification));
    return all.dump(2);
}

std::string notificationLine(const Variant &notification)
{
    return summary(notificationJson(notification));
}

Event eventOf(const Variant &event)
{
    const ordered_json json = eventJson(event);
    return {plain(json["app"]), json.dump(), lineOf(json)};
}

} // namespace pelliko::quickpanel_tool
