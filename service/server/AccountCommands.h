#pragma once

#include <filesystem>
#include <string>

namespace pelliko::server
{

/// The `account` commands. Each works beside a running server, prints its result to standard output
/// and returns the program's exit code; a failure is one sentence on standard error.
int addAccountCommand(const std::filesystem::path &data, const std::string &number,
                      const std::string &name);
int listAccountsCommand(const std::filesystem::path &data);
int removeAccountCommand(const std::filesystem::path &data, const std::string &number);

} // namespace pelliko::server
