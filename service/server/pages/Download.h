#pragma once

#include "http/Context.h"

#include <string>

namespace pelliko::server
{

/// `/s/{token}`: the landing page; refuses when the store has lost every file.
Task<void> showLandingPage(Exchange &exchange, Context &context, std::string token);

/// `/s/{token}/{index}`: one file, whole or a range.
Task<void> downloadFile(Exchange &exchange, Context &context, std::string token, std::size_t index);

/// Sends a file of a live share, whole or the range that the request asks for.
Task<void> sendShareFile(Exchange &exchange, Context &context, const FileRecord &file);

/// `/s/{token}/all.zip`: all files that the store has not lost, made while they are sent.
Task<void> downloadAll(Exchange &exchange, Context &context, std::string token);

} // namespace pelliko::server
