#pragma once

#include <kor_account.h>

#include <optional>

namespace pelliko::service
{

using korrin::Account;

/**
 * The account as it is now, for one call to the server; PELLIKO_SERVER_URL replaces its address.
 * @return nothing, with a line in the log, when there is no usable account
 */
std::optional<Account> usableAccount(const std::string &file);

} // namespace pelliko::service
