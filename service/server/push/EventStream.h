// Pushes over server-sent events
#pragma once

#include "http/Context.h"

namespace pelliko::server
{

/// `GET /api/v1/push`: the account's pushes, for as long as the reader stays.
Task<void> streamPushes(Exchange &exchange, Context &context);

/// `POST /api/v1/push/ack`.
Task<void> acknowledgePushes(Exchange &exchange, Context &context);

} // namespace pelliko::server
