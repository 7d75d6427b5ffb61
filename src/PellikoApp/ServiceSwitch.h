#pragma once

#include "PellikoApp/AppData.h"

// The background service tells that it is switched on or off, or that the account is gone. With the
// last two the application leaves the panel and ends at once, whatever is pending. Main loop only.

namespace pelliko
{

/// Announces the shares again that were announced when the service was switched off. Without any
/// the main loop is asked to end.
/// @return whether there are any
bool switchServiceOn(PellikoAppData *ad);

/// Keeps the received shares that are announced for the time when the service is switched on again,
/// removes every notification and asks the main loop to end.
void switchServiceOff(PellikoAppData *ad);

/// Removes every notification, the pending uploads, the preferences and the thumbnails, and asks
/// the main loop to end.
void forgetAccount();

} // namespace pelliko
