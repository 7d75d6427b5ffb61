#pragma once

#include "http/Context.h"

#include <memory>
#include <string>

namespace pelliko::server
{

/// The upload of this account, still wanted; anything else is refused.
Task<UploadRecord> findWantedUpload(Context &context, std::int64_t account, std::string upload);

/// Appends the request's body at its Upload-Offset, as the upload's only writer. Whatever ends the
/// body early, what arrived is kept. Returns the upload with its new offset, which is on stable
/// storage.
Task<UploadRecord> appendBody(Exchange &exchange, Context &context, std::int64_t account,
                              std::string upload);

} // namespace pelliko::server
