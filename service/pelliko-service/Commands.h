#pragma once

#include <string>

namespace pelliko::service
{

/** Writes the account; the token is read from standard input. @return the exit status */
int accountCommand(const std::string &file, const std::string &server, const std::string &number);

/** Prints the requests of the running service as a table or as JSON. @return the exit status */
int statusCommand(bool json);

} // namespace pelliko::service
