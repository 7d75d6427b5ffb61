// The bodies of the calls about accounts
#pragma once

#include "shares/Limits.h"

#include <string>
#include <string_view>
#include <vector>

namespace pelliko::server
{

/// What somebody who wants an account tells; nothing is checked but that both are texts.
struct RegistrationBody {
    std::string number;
    std::string code;
};

/// Reads the body of "make an account"; malformed JSON or members of a wrong kind are refused.
[[nodiscard]] RegistrationBody parseRegistration(std::string_view json);

/// The numbers of a question about who has joined, sorted, each once; anything that is not 1 to
/// `limits.numbersPerQuestion` numbers in E.164 form is refused.
[[nodiscard]] std::vector<std::string> parseNumbers(std::string_view json, const Limits &limits);

/// The answers.
[[nodiscard]] std::string registeredJson(const std::string &number, const std::string &token);
[[nodiscard]] std::string joinedJson(const std::vector<std::string> &numbers);

} // namespace pelliko::server
