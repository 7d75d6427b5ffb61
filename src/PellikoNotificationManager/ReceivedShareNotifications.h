#pragma once

#include "PellikoApp/AppData.h"

// What others have shared with the user, in the panel: one notification that replaces the one
// before it, and a ticker. Main loop only.

namespace pelliko
{

/// The tag of the notification of received shares.
constexpr const char *pushNotificationTag = "PUSH_NOTI";

/// Announces the shares of the push that the record holds: a single one opens the viewer, several
/// open the history and list their senders, who are forgotten once it is shown. May block for a
/// second when the sender's name is not there yet.
/// @return 0 when notification and ticker were posted, else -1 (logged)
int addPushNotification(PellikoAppData *ad);

/// The same for the one share of contents_token_list[0]; the table of senders is left alone.
int _addSingleSharedPushNotification(PellikoAppData *ad);

} // namespace pelliko
