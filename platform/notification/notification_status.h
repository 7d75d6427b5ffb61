/* Short messages to the user (toasts). */
#ifndef PELLIKO_PLATFORM_NOTIFICATION_STATUS_H
#define PELLIKO_PLATFORM_NOTIFICATION_STATUS_H

#ifdef __cplusplus
extern "C" {
#endif

/**
 * Shows a short message that disappears by itself. Returns once the panel service has accepted it,
 * so the message is shown even when the process ends right afterwards. The text is copied.
 * NOTIFICATION_ERROR_INVALID_PARAMETER for NULL, NOTIFICATION_ERROR_SERVICE_NOT_READY when the
 * panel service cannot be reached.
 */
int notification_status_message_post(const char *message);

#ifdef __cplusplus
}
#endif

#endif
