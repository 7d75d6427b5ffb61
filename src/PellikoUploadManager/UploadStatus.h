#pragma once

#include <cstdint>

namespace pelliko
{

/// The one status callback of every upload that was started, reshared or resumed; a
/// pelliko_upload_status_cb. Keeps the node, its notification, its row and the preferences in step
/// with the service, and asks the exit policy when the request has ended. Main loop only.
/// @param status PellikoUploadStatus
/// @param input_param path of a file made for this share only, or null; borrowed
/// @param progress_percent 0 to 100
/// @param expired_time seconds since the epoch
/// @param error_code 0: none; any other value ends the request whatever the status
/// @param user_data the application record
void uploadResponseStatusCb(int status, const char *input_param, int progress_percent,
                            int64_t expired_time, int unused, int error_code, int request_id,
                            void *user_data);

} // namespace pelliko
