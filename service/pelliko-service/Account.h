#pragma once

#include <optional>
#include <string>

namespace pelliko::service
{

/** The user's account at a share server. */
struct Account {
    std::string server; ///< base address without a slash at its end
    std::string number; ///< the user's own phone number
    std::string token;  ///< secret
};

/** Where the account is kept when nothing else is said. */
std::string defaultAccountFile();

/**
 * Reads the account; PELLIKO_SERVER_URL replaces the server's address.
 * @return nothing, with a line in the log, when there is no usable account
 */
std::optional<Account> readAccount(const std::string &file);

/**
 * Writes the account for the user alone, at once or not at all, and onto the disk.
 * @return empty, or what went wrong as one sentence
 */
std::string writeAccount(const std::string &file, const Account &account);

/** Why the three parts cannot be an account, as one sentence; empty when they can. */
std::string accountFault(const Account &account);

} // namespace pelliko::service
