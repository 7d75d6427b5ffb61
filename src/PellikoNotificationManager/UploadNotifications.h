#pragma once

#include "PellikoApp/AppData.h"
#include "PellikoUploadDataManager/UploadNotiData.h"

#include <notification.h>

// The notification that follows an upload: preparing, sending, paused, notifying the recipients,
// sent or failed. Each replaces the one before it. "The current upload" is g_current_node; its
// `notif` holds the handle of what is shown. A step that fails is logged and ends the operation.
// Main loop only.

namespace pelliko
{

/// True for the service's error codes that mean a trouble of the server: -16, -7 and -4.
bool _isServerError(int error_code);

/// Posts the "preparing" notification with its ticker.
/// @param kind 0; another value leaves out layout, pictures, texts and ticker, 3 also the launch
///             request
/// @param notification_ref the node's `notif`; a handle that it holds is freed
void addProgressNotification(int kind, notification_h *notification_ref);

/// Replaces a "preparing" or "paused" notification by "sending", and moves the bar.
/// @param progress_percent 0 to 100; 100 leaves the bar where it is
/// @return 1 when the bar was set or the percent is 100 or more, else 0
int updateUploadNotificationSendingStatus(PellikoAppData *ad, int progress_percent,
                                          notification_h *notification_ref,
                                          const char *noti_priv_id);

/// Replaces the node's notification by "paused", unless it is that already.
/// @param status PellikoUploadStatus; only 6 acts
void addPausedNotification(UploadNotiData *node, int status);

/// Shows "notifying the recipients". The node does not keep the handle: the next notification with
/// the same tag replaces this one.
void updateUploadNotificationWaitForNoti();

/// Shows "sent" with its ticker and ends a resume after a reboot.
void updateUploadNotificationSent(int total_files);

/// Shows "failed" with the reason; error code 0 only takes the old notification away.
void uploadAddFailedNotification(PellikoAppData *ad, int status, int error_code);

} // namespace pelliko
