#pragma once

#include "http/Context.h"
#include "http/Message.h"

namespace pelliko::server
{

/// Answers one request, whatever happens on the way: the only place where a refusal or a failure
/// of the store becomes an answer. Throws Disconnected when there is nobody left to answer.
Task<void> handleRequest(Exchange &exchange, Context &context);

/// The answer to a head that could not be read.
[[nodiscard]] Response refuseHead(bool tooLarge);

} // namespace pelliko::server
