// Answers for balancers and monitors
#pragma once

#include "http/Context.h"

namespace pelliko::server
{

/// `GET /healthz`: "ok" when the metadata store answers.
Task<void> showHealth(Exchange &exchange, Context &context);

/// `GET /readyz`: "ok" when new requests are welcome; 503 while the server drains or its metadata
/// store does not answer.
Task<void> showReadiness(Exchange &exchange, Context &context);

/// What the monitoring address answers: the two above and `GET /metrics`.
Task<void> handleMonitoring(Exchange &exchange, Context &context);

} // namespace pelliko::server
