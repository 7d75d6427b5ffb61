#pragma once

#include <cstdint>

// Tells the history application that there is a new share to show. Only a running one is told; it
// is never started for this. Main loop only.

namespace pelliko
{

/// A new upload was shared.
void _sendSharedNotification(int32_t request_id);

/// An earlier upload was shared again under `request_id`.
void _sendResharedNotification(int32_t request_id);

} // namespace pelliko
