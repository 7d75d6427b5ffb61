#pragma once

#include "Account.h"

#include <string>

namespace pelliko::service
{

/** Writes the account; its token is read from standard input. @return the exit status */
int accountCommand(const std::string &file, Account account);

/** Prints the requests of the running service as a table or as JSON. @return the exit status */
int statusCommand(bool json);

} // namespace pelliko::service
