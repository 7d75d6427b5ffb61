#pragma once

#include "store/OpenStores.h"

#include <cstdint>
#include <string>

namespace pelliko::server
{

/// The `account` commands. Each works beside a running server, prints its result to standard output
/// and returns the program's exit code; a failure is one sentence on standard error.
int addAccountCommand(const StoreUrls &stores, const std::string &number, const std::string &name);
int listAccountsCommand(const StoreUrls &stores);
int removeAccountCommand(const StoreUrls &stores, const std::string &number);

/// How an invitation is made: for how many accounts, and for how many seconds.
struct InvitationOptions {
    int uses = 1;
    std::int64_t lifetime = 7 * 86400;
};
int inviteCommand(const StoreUrls &stores, const InvitationOptions &options);
int listInvitationsCommand(const StoreUrls &stores);
int revokeInvitationCommand(const StoreUrls &stores, std::int64_t id);
/// A code with which the number's account moves to another phone.
int renewAccountCommand(const StoreUrls &stores, const std::string &number, std::int64_t lifetime);

} // namespace pelliko::server
