// What others have shared with an account
#pragma once

#include "http/Context.h"

#include <string>

namespace pelliko::server
{

/// The calls about received shares, see docs/server-api.md. Each authenticates its caller; `key` is
/// a content token, or the id of the push in decimal.
Task<void> listReceived(Exchange &exchange, Context &context);
Task<void> showReceived(Exchange &exchange, Context &context, std::string key);
Task<void> forgetReceived(Exchange &exchange, Context &context, std::string key);
Task<void> downloadReceived(Exchange &exchange, Context &context, std::string key,
                            std::string index);

} // namespace pelliko::server
