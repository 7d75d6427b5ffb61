#include "AccountSim.h"

#include <glib.h>
#include <nlohmann/json.hpp>

namespace pelliko::modem
{

std::string accountFile()
{
    const char *configured = g_getenv("XDG_CONFIG_HOME");
    const std::string folder =
        configured && *configured ? configured : std::string(g_get_home_dir()) + "/.config";
    return folder + "/pelliko/account.json";
}

std::string accountImsi()
{
    // Not by a stream: that throws where the account is a folder.
    g_autofree char *text = nullptr;
    gsize length = 0;
    if (!g_file_get_contents(accountFile().c_str(), &text, &length, nullptr))
        return {};
    const auto account = nlohmann::json::parse(text, text + length, nullptr, false);
    if (!account.is_object())
        return {};
    const auto imsi = account.find("imsi");
    return imsi != account.end() && imsi->is_string() ? imsi->get<std::string>() : std::string();
}

} // namespace pelliko::modem
