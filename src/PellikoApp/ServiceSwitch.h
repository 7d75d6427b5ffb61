#pragma once

#include "PellikoApp/AppData.h"

// The background service tells that it is switched off, or that the account is gone. The
// application then leaves the panel and ends at once, whatever is pending. Main loop only.

namespace pelliko
{

/// Keeps the received shares that are announced for the time when the service is switched on again,
/// removes every notification and asks the main loop to end.
void switchServiceOff(PellikoAppData *ad);

/// Removes every notification, the pending uploads, the preferences and the thumbnails, and asks
/// the main loop to end.
void forgetAccount();

} // namespace pelliko
