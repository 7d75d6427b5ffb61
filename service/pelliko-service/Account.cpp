#include "Account.h"

#include <glib.h>

#include <cstdlib>

namespace pelliko::service
{

std::optional<Account> usableAccount(const std::string &file)
{
    korrin::AccountFinding found = korrin::findAccount(file);
    if (found.kind != korrin::AccountFinding::Kind::account) {
        g_warning("no account: %s; make one by signing in or with 'pelliko-service account'",
                  found.reason.c_str());
        return std::nullopt;
    }
    if (const char *server = std::getenv("PELLIKO_SERVER_URL"); server && *server)
        found.account.server = korrin::plainServer(server);
    if (const std::string fault = korrin::accountFault(found.account); !fault.empty()) {
        g_warning("no account: %s", fault.c_str());
        return std::nullopt;
    }
    return std::move(found.account);
}

} // namespace pelliko::service
