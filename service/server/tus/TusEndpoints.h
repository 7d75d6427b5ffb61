#pragma once

#include "http/Context.h"

#include <string>

namespace pelliko::server
{

/// `/api/v1/uploads`: what the server can do, and new uploads.
Task<void> tusCollection(Exchange &exchange, Context &context);

/// `/api/v1/uploads/{upload}`: offset, append, drop.
Task<void> tusUpload(Exchange &exchange, Context &context, std::string upload);

} // namespace pelliko::server
