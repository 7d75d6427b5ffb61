// Which phone numbers have accounts
#pragma once

#include "http/Context.h"

#include <string_view>

namespace pelliko::server
{

/// `POST /api/v1/joined`: which of these numbers have accounts.
Task<void> showJoined(Exchange &exchange, Context &context);

/// A plus, a digit other than zero, 7 to 15 digits in all. Other ways to write a number are not
/// understood here: whoever asks makes the one form first.
[[nodiscard]] bool isE164(std::string_view number);

} // namespace pelliko::server
