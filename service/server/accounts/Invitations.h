#pragma once

#include "http/Context.h"

#include <string>
#include <string_view>

namespace pelliko::server
{

/// `POST /api/v1/accounts`: a number and an invitation code become an account with a token.
Task<void> registerAccount(Exchange &exchange, Context &context);

/// True for "+" and 7 to 15 digits that begin with no zero, the one form that accounts are made in.
[[nodiscard]] bool isInternationalNumber(std::string_view number);

/// Makes an invitation and returns its code, which is kept nowhere. With `number` the code renews
/// that number's account. Blocks.
[[nodiscard]] std::string makeInvitation(Metadata &metadata, const std::string &number, int uses,
                                         Seconds now, Seconds expires);

} // namespace pelliko::server
