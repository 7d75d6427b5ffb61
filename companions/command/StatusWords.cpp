#include "StatusWords.h"

#include "Output.h"

#include <glib.h>

#include <nlohmann/json.hpp>

#include <array>

namespace pelliko::command
{
namespace
{

using companion::SentShare;

constexpr std::array stateWords = {"uploading",   "paused",    "telling",   "available", "expired",
                                   "withdrawing", "withdrawn", "cancelled", "failed"};
constexpr std::array toldWords = {"not yet", "push", "sms", "nobody"};

std::string minuteOf(int64_t seconds)
{
    g_autoptr(GDateTime) time = g_date_time_new_from_unix_local(seconds);
    if (!time)
        return {};
    g_autofree char *text = g_date_time_format(time, "%Y-%m-%d %H:%M");
    return text ? text : "";
}

std::string sizeText(int64_t bytes)
{
    g_autofree char *text = g_format_size(static_cast<guint64>(bytes));
    return text;
}

nlohmann::ordered_json filesOf(const SentShare &share)
{
    auto list = nlohmann::ordered_json::array();
    for (const companion::ShareFile &file : share.files)
        list.push_back({{"name", file.name}, {"size", file.size}, {"type", file.type}});
    return list;
}

nlohmann::ordered_json recipientsOf(const SentShare &share)
{
    auto list = nlohmann::ordered_json::array();
    for (const companion::Recipient &recipient : share.recipients)
        list.push_back({{"name", recipient.name},
                        {"number", recipient.number},
                        {"told", toldWords.at(recipient.told)}});
    return list;
}

} // namespace

const char *stateWord(pelliko_share_state_e state)
{
    return static_cast<std::size_t>(state) < stateWords.size() ? stateWords.at(state) : "unknown";
}

std::string stateText(const SentShare &share)
{
    std::string word = stateWord(share.state);
    switch (share.state) {
    case PELLIKO_SHARE_UPLOADING:
    case PELLIKO_SHARE_PAUSED:
        return word + " " + std::to_string(share.percent) + " %";
    case PELLIKO_SHARE_AVAILABLE:
        return share.expires > 0 ? word + " until " + minuteOf(share.expires) : word;
    case PELLIKO_SHARE_FAILED:
        return word + " (error " + std::to_string(share.error) + ")";
    default:
        return word;
    }
}

std::string contentText(const SentShare &share)
{
    std::string text = share.files.size() == 1 ? printable(share.files.front().name)
                                               : std::to_string(share.files.size()) + " files";
    text += ", " + sizeText(share.size);
    if (!share.recipients.empty())
        text += " for " + printable(share.recipients.front().name);
    if (share.recipients.size() > 1)
        text += " and " + std::to_string(share.recipients.size() - 1) + " more";
    return text;
}

std::string jsonOf(const SentShare &share)
{
    const nlohmann::ordered_json object = {{"id", share.id},
                                           {"state", stateWord(share.state)},
                                           {"percent", share.percent},
                                           {"error", share.error},
                                           {"created", share.created},
                                           {"expires", share.expires},
                                           {"size", share.size},
                                           {"files", filesOf(share)},
                                           {"recipients", recipientsOf(share)}};
    return object.dump(-1, ' ', false, nlohmann::ordered_json::error_handler_t::replace);
}

} // namespace pelliko::command
