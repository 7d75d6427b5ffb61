// Which phone numbers have accounts
#pragma once

#include "http/Context.h"

namespace pelliko::server
{

/// `POST /api/v1/joined`: which of these numbers have accounts.
Task<void> showJoined(Exchange &exchange, Context &context);

} // namespace pelliko::server
