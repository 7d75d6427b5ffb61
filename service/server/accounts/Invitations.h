#pragma once

#include "http/Context.h"

#include <string>

namespace pelliko::server
{

/// `POST /api/v1/accounts`: a number and an invitation code become an account with a token.
Task<void> registerAccount(Exchange &exchange, Context &context);

/// Makes an invitation and returns its code, which is kept nowhere. With `number` the code renews
/// that number's account. Blocks.
[[nodiscard]] std::string makeInvitation(Metadata &metadata, const std::string &number, int uses,
                                         Seconds now, Seconds expires);

} // namespace pelliko::server
