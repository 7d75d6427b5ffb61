#pragma once

#include "http/Context.h"

#include <optional>
#include <string>

namespace pelliko::server
{

/// The hash of the token that the request carries; without one that may be a token it is refused.
[[nodiscard]] std::string tokenHashOf(const Request &request);

/// The account that has the token of this hash; without one the request is refused. Blocks.
[[nodiscard]] Account needAccount(Metadata &metadata, const std::string &tokenHash);

/// The account whose token the request carries; anything else is refused.
Task<Account> authenticate(Exchange &exchange, Context &context);

/// `GET /api/v1/account`.
Task<void> showAccount(Exchange &exchange, Context &context);

/// Makes an account and returns its token, which is kept nowhere. Nothing when the number has an
/// account already. Blocks.
[[nodiscard]] std::optional<std::string> makeAccount(Metadata &metadata, const std::string &number,
                                                     const std::string &name, Seconds now);

} // namespace pelliko::server
