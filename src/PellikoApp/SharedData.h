// Where the application puts the files that it makes for a share.
#pragma once

namespace pelliko
{

/// Memo files and vCards lie here until their share is complete; the upload service reads them
/// here. Ends with a slash.
inline constexpr const char *sharedDataDirectory = "/opt/usr/apps/com.velmora.pelliko/shared/data/";

} // namespace pelliko
