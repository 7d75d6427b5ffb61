#include "Account.h"

#include <gio/gio.h>
#include <nlohmann/json.hpp>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>

namespace pelliko::service
{
namespace
{
std::string withoutSlash(std::string address)
{
    while (!address.empty() && address.back() == '/') {
        address.pop_back();
    }
    return address;
}

bool isPlain(const std::string &text)
{
    return std::all_of(text.begin(), text.end(),
                       [](unsigned char c) { return c > 0x20 && c < 0x7f; });
}

std::optional<Account> parse(const char *text, size_t length)
{
    const auto json = nlohmann::json::parse(text, text + length, nullptr, false);
    if (!json.is_object()) {
        return std::nullopt;
    }
    const auto member = [&json](const char *name) {
        const auto found = json.find(name);
        return found != json.end() && found->is_string() ? found->get<std::string>()
                                                         : std::string();
    };
    return Account{withoutSlash(member("server")), member("number"), member("token")};
}
} // namespace

std::string defaultAccountFile()
{
    g_autofree char *path =
        g_build_filename(g_get_user_config_dir(), "pelliko", "account.json", nullptr);
    return path;
}

std::string accountFault(const Account &account)
{
    if (!g_str_has_prefix(account.server.c_str(), "http://") &&
        !g_str_has_prefix(account.server.c_str(), "https://")) {
        return "the server's address has to begin with http:// or https://";
    }
    if (account.number.empty() || account.token.empty()) {
        return "the account lacks a number or a token";
    }
    if (!isPlain(account.server) || !isPlain(account.number) || !isPlain(account.token)) {
        return "address, number and token may hold visible characters only";
    }
    return {};
}

std::optional<Account> readAccount(const std::string &file)
{
    g_autofree char *text = nullptr;
    gsize length = 0;
    g_autoptr(GError) error = nullptr;
    if (!g_file_get_contents(file.c_str(), &text, &length, &error)) {
        g_warning("no account: %s; make one with 'pelliko-service account'", error->message);
        return std::nullopt;
    }
    std::optional<Account> account = parse(text, length);
    if (!account) {
        g_warning("no account: %s holds no JSON object", file.c_str());
        return std::nullopt;
    }
    if (const char *server = std::getenv("PELLIKO_SERVER_URL"); server && *server) {
        account->server = withoutSlash(server);
    }
    if (const std::string fault = accountFault(*account); !fault.empty()) {
        g_warning("no account: %s: %s", file.c_str(), fault.c_str());
        return std::nullopt;
    }
    return account;
}

std::string writeAccount(const std::string &file, const Account &account)
{
    g_autofree char *folder = g_path_get_dirname(file.c_str());
    if (g_mkdir_with_parents(folder, 0700) != 0) {
        return std::string("cannot make ") + folder + ": " + std::strerror(errno);
    }
    const std::string text = nlohmann::json{{"server", withoutSlash(account.server)},
                                            {"number", account.number},
                                            {"token", account.token}}
                                 .dump() +
                             "\n";
    const auto flags = static_cast<GFileSetContentsFlags>(G_FILE_SET_CONTENTS_CONSISTENT |
                                                          G_FILE_SET_CONTENTS_DURABLE);
    g_autoptr(GError) error = nullptr;
    if (!g_file_set_contents_full(file.c_str(), text.data(), static_cast<gssize>(text.size()),
                                  flags, 0600, &error)) {
        return error->message;
    }
    return {};
}

} // namespace pelliko::service
