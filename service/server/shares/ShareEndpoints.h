#pragma once

#include "http/Context.h"

#include <string>

namespace pelliko::server
{

/// The JSON calls about shares, see docs/server-api.md. Each authenticates its caller.
Task<void> createShare(Exchange &exchange, Context &context);
Task<void> listShares(Exchange &exchange, Context &context);
Task<void> showShare(Exchange &exchange, Context &context, std::string key);
Task<void> finishShare(Exchange &exchange, Context &context, std::string key);
Task<void> withdrawShare(Exchange &exchange, Context &context, std::string key);

} // namespace pelliko::server
