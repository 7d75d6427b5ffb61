#pragma once

#include "PellikoApp/AppData.h"

// Hands a confirmed share over to the upload service. Main loop only.

namespace pelliko
{

/// Uploads the files of ad->upload_item to its recipients. On success the request is in the pending
/// list and in the table, and ad->upload_item->request_id is set. The recipient texts must describe
/// this share (_populateExtraData).
/// @return 0; the service's negative error code, then the new node stays in the list with request
///         id 0; -1 without a record or an item. Also 0 when no node could be made: the service is
///         not called then, the list is as before and the item keeps an earlier request id.
int uploadStart(PellikoAppData *ad);

/// Sends the upload ad->req_id_to_reshare to the recipients of ad->upload_item without uploading it
/// again; the new request's id is in ad->reshared_request_id.
/// @return as uploadStart; -1 also when there is no upload to reshare
int reshareUploadStart(PellikoAppData *ad);

/// The row of the extension table that a file's type is reported as, or `previous` (may be null)
/// when the file has none: the type is carried over from the file before it.
const char *_uploadFileType(const char *path, const char *previous);

} // namespace pelliko
