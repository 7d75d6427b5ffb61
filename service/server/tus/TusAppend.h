#pragma once

#include "http/Context.h"

#include <memory>
#include <string>

namespace pelliko::server
{

/// The upload of this account, still wanted; anything else is refused.
Task<UploadRecord> findWantedUpload(Context &context, std::int64_t account, std::string upload);

/// Appends the request's body at its Upload-Offset, as the upload's only writer. Whatever ends the
/// body early, what arrived is kept. Returns the new offset; it is on stable storage.
Task<std::uint64_t> appendBody(Exchange &exchange, Context &context, std::int64_t account,
                               std::string upload);

} // namespace pelliko::server
