#include "AccountSim.h"

#include <fstream>
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
    std::ifstream file(accountFile(), std::ios::binary);
    const auto account = nlohmann::json::parse(file, nullptr, false);
    if (!account.is_object())
        return {};
    const auto imsi = account.find("imsi");
    return imsi != account.end() && imsi->is_string() ? imsi->get<std::string>() : std::string();
}

} // namespace pelliko::modem
