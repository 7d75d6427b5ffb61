#pragma once

#include "PellikoUploadDataManager/UploadNotiData.h"

#include <app_control.h>
#include <notification.h>

// What all upload notifications share: the tag by which one is found again, and the launch request
// that brings the upload's figures back when it is tapped. Main loop only.

namespace pelliko
{

/// Application id of the notifications' launch requests: the application itself.
constexpr const char *applicationId = "com.velmora.pelliko";

/// The state that a notification shows, carried as "upload_status" in its launch request. These are
/// the application's own codes, not the service's status values.
enum NotificationState : int {
    NOTI_STATE_PREPARING = 0,
    NOTI_STATE_PAUSED = 1,
    NOTI_STATE_PAUSED_BY_SERVICE = 2, ///< read like "paused"; no notification carries it
    NOTI_STATE_SENDING = 3,
    NOTI_STATE_CANCELLED = 4, ///< of the status popup only
    NOTI_STATE_NOTIFYING = 5,
    NOTI_STATE_SENT = 6,
    NOTI_STATE_FAILED_SERVER = 8,
    NOTI_STATE_FAILED_DEVICE = 9
};

/// Deletes every posted notification of this application of that type.
void deleteAllNotificationsOfType(notification_type_e type);

/// Tags a notification with the upload's request id and posts it. A state other than "preparing",
/// or a resume after a reboot, means the upload of g_current_node, otherwise the share in hand.
/// Without the one that is meant the process ends at once: a notification that belongs to nothing
/// could never be taken back.
/// @return 0 or a negative notification error
int _notificationInsert(notification_h notification, int state_code);

/// Deletes the posted notification of g_current_node, whose handle is in *notification_ref: the
/// handle is freed, *notification_ref set to null and the node's tag cleared.
/// @param noti_id the node's tag
/// @return 1 when it was deleted, 0 otherwise; then nothing has changed
int deleteNotificationById(notification_h *notification_ref, const char *noti_id);

/// Puts a handle (may be null) into a slot and frees the one that it replaces. The posted
/// notification stays in the panel.
void replaceNotificationHandle(notification_h *slot, notification_h handle);

/// Adds the seven figures of the upload to a launch request. Which upload: as for
/// _notificationInsert, but a missing one is only logged and gives zeros.
void _addExtraData(app_control_h app_control, int state_code);

/// Removes six of the seven keys; "total_size" stays and is overwritten by the next _addExtraData.
void _removeExtraData(app_control_h app_control);

} // namespace pelliko
