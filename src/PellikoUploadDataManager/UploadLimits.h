// The limits of a share: its files, its bytes, and the bytes of a day.
#pragma once

#include "PellikoApp/AppData.h"

namespace pelliko
{

/// Whether the share in hand (ad->upload_item) keeps the limits: 0 when it may go on; -1 when it is
/// refused, after the user was told why, or when there is none. Main loop only.
int checkMaximumTotalUploadExceeded(PellikoAppData *ad);

/// 1 when the bytes of the running 24 hours have reached 2 GiB - 1 (or, in the signed sum that is
/// kept, passed it), else 0. A period that is over is closed. A value that the store cannot give
/// counts as 0. Main loop only.
int _isServerUsageExceeded();

} // namespace pelliko
