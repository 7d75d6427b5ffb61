#include "PellikoNotificationManager/UploadNotifications.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/TextFormat.h"
#include "PellikoNotificationManager/NotificationBuilder.h"
#include "PellikoNotificationManager/NotificationPrimitives.h"
#include "PellikoUploadingDataManager/PressedNotification.h"

#include <pelliko_client.h>
#include <tizen_error.h>

namespace pelliko
{

namespace
{

constexpr const char *preparingId = "IDS_RSH_TMBODY_PREPARING_TO_SEND_FILES_ING_ABB";
constexpr const char *waitingId = "IDS_RSH_SBODY_WAITING_FOR_CONNECTION_ING_M_STATUS_ABB";
constexpr const char *sendingTickerId = "IDS_RSH_TMBODY_SENDING_ING_ABB";
constexpr const char *sendingFilesId = "IDS_RSH_MBODY_SENDING_PD_FILES_ING";
constexpr const char *sendingOneFileId = "IDS_RSH_MBODY_SENDING_1_FILE_ING";
constexpr const char *pausedId = "IDS_RSH_MBODY_SENDING_PAUSED";
constexpr const char *notifyingId =
    "IDS_RSH_BODY_SENDING_NOTIFICATIONS_TO_RECIPIENTS_ING_M_STATUS_ABB";
constexpr const char *sentId = "IDS_BT_SBODY_FILES_SENT_M_STATUS_ABB";
constexpr const char *succeededId = "IDS_RSH_SBODY_PD_SUCCEEDED_ABB";
constexpr const char *failedId = "IDS_RSH_TMBODY_FAILED_TO_SEND_FILES_ABB";
constexpr const char *serverErrorId = "IDS_RSH_SBODY_SERVER_ERROR_OCCURRED_ABB";
constexpr const char *deviceErrorId = "IDS_RSH_SBODY_DEVICE_ERROR_OCCURRED_ABB";

constexpr const char *noRequestText = "app_control_create() is failed !!";
constexpr size_t sendingTitleSize = 100;
constexpr size_t sentContentSize = 512;
constexpr int lastBarPercent = 99; ///< the bar never reaches its end while files are sent

// Codes of the upload service that have no name.
constexpr int errorServerFirst = -16;
constexpr int errorServerSecond = -7;

int _deleteCurrentNotification()
{
    if (!g_current_node)
        return 0;
    return deleteNotificationById(&g_current_node->notif, g_current_node->noti_priv_id);
}

bool _showPreparing(notification_h notification)
{
    if (setLayout(notification, NOTIFICATION_LY_ONGOING_EVENT) != NOTIFICATION_ERROR_NONE ||
        setImages(notification, panelIcon, indicatorIcon) != NOTIFICATION_ERROR_NONE)
        return false;
    LOG_DEBUG("Adding new notification with title = <Preparing to upload>");
    return setText(notification, NOTIFICATION_TEXT_TYPE_TITLE, preparingId) ==
               NOTIFICATION_ERROR_NONE &&
           setText(notification, NOTIFICATION_TEXT_TYPE_CONTENT, waitingId) ==
               NOTIFICATION_ERROR_NONE &&
           postTicker(NOTIFICATION_LY_NOTI_EVENT_SINGLE, translated(sendingTickerId),
                      sendingTickerId);
}

// No files, no title.
int _setSendingTitle(notification_h notification, int total_files)
{
    if (total_files > 1) {
        char title[sendingTitleSize];
        formatTranslated(title, sizeof(title), translated(sendingFilesId), "d", total_files);
        return setCountText(notification, NOTIFICATION_TEXT_TYPE_TITLE, title, sendingFilesId,
                            total_files);
    }
    if (total_files == 1)
        return setCountText(notification, NOTIFICATION_TEXT_TYPE_TITLE,
                            translated(sendingOneFileId), sendingOneFileId, total_files);
    return NOTIFICATION_ERROR_NONE;
}

bool _buildSending(notification_h *notification_ref)
{
    notification_h notification = notification_create(NOTIFICATION_TYPE_ONGOING);
    replaceNotificationHandle(notification_ref, notification);
    if (!notification) {
        LOG_ERROR("notification_create failed...");
        return false;
    }
    if (setImages(notification, animatedPanelIcon, animatedIndicatorIcon) !=
            NOTIFICATION_ERROR_NONE ||
        setLayout(notification, NOTIFICATION_LY_ONGOING_PROGRESS) != NOTIFICATION_ERROR_NONE ||
        setDisplay(notification, displayTrayAndIndicator) != NOTIFICATION_ERROR_NONE ||
        _setSendingTitle(notification, g_current_node->total_files) != NOTIFICATION_ERROR_NONE ||
        !attachLaunchRequest(notification, NOTI_STATE_SENDING, OldFigures::remove,
                             WithoutRequest::give_up, noRequestText))
        return false;
    const int err = _notificationInsert(notification, NOTI_STATE_SENDING);
    if (err != NOTIFICATION_ERROR_NONE)
        LOG_ERROR("_notificationInsert failed [%d]", err);
    return err == NOTIFICATION_ERROR_NONE;
}

int _moveBar(notification_h notification, int progress_percent)
{
    if (g_cancel_in_progress == 1)
        return 0;
    LOG_DEBUG("progress_percent = %d", progress_percent);
    if (progress_percent > lastBarPercent)
        return 1;
    const double part = progress_percent / 100.0;
    notification_set_progress(notification, part);
    const int err = notification_update(notification);
    if (err != NOTIFICATION_ERROR_NONE)
        LOG_ERROR("notification_update failed [%d]", err);
    LOG_DEBUG("Updating progress on notification = %d with percent = %f",
              g_current_node->request_id, part);
    return 1;
}

bool _buildPaused(notification_h notification)
{
    if (setLayout(notification, NOTIFICATION_LY_ONGOING_EVENT) != NOTIFICATION_ERROR_NONE ||
        setImages(notification, panelIcon, indicatorIcon) != NOTIFICATION_ERROR_NONE)
        return false;
    LOG_DEBUG("Updating notification with text <Uploading Paused>");
    if (setText(notification, NOTIFICATION_TEXT_TYPE_TITLE, pausedId) != NOTIFICATION_ERROR_NONE ||
        setText(notification, NOTIFICATION_TEXT_TYPE_CONTENT, waitingId) != NOTIFICATION_ERROR_NONE)
        return false;
    attachLaunchRequest(notification, NOTI_STATE_PAUSED, OldFigures::remove, WithoutRequest::go_on,
                        noRequestText);
    const int err = _notificationInsert(notification, NOTI_STATE_PAUSED);
    if (err != NOTIFICATION_ERROR_NONE)
        LOG_ERROR("_notificationInsert failed [%d]", err);
    else
        LOG_DEBUG("_notificationInsert success");
    return err == NOTIFICATION_ERROR_NONE;
}

// A trouble with the looks is logged and does not keep the notification from being shown.
void _postNotifying(notification_h notification)
{
    setLayout(notification, NOTIFICATION_LY_ONGOING_EVENT);
    setImages(notification, panelIcon, indicatorIcon);
    LOG_DEBUG("Updating notification with text <Sending notifications to recipients...>");
    setText(notification, NOTIFICATION_TEXT_TYPE_TITLE, notifyingId);
    setDisplay(notification, displayTray);
    attachLaunchRequest(notification, NOTI_STATE_NOTIFYING, OldFigures::none, WithoutRequest::go_on,
                        noRequestText);
    const int err = _notificationInsert(notification, NOTI_STATE_NOTIFYING);
    if (err != NOTIFICATION_ERROR_NONE)
        LOG_ERROR("_notificationInsert fail, noti_err = %d", err);
}

bool _isNotifyingShown()
{
    if (!g_current_node || !g_current_node->notif)
        return false;
    std::string title;
    if (!readTitle(g_current_node->notif, title))
        return true;
    if (!titleIs(title, notifyingId))
        return false;
    LOG_DEBUG("Notification already added. returning");
    return true;
}

bool _postSent(notification_h notification, const char *content, int total_files)
{
    if (setLayout(notification, NOTIFICATION_LY_NOTI_EVENT_MULTIPLE) != NOTIFICATION_ERROR_NONE ||
        setImages(notification, panelIcon, indicatorIcon) != NOTIFICATION_ERROR_NONE)
        return false;
    LOG_DEBUG("Upload Complete. Updating notification");
    if (setText(notification, NOTIFICATION_TEXT_TYPE_TITLE, sentId) != NOTIFICATION_ERROR_NONE ||
        setCountText(notification, NOTIFICATION_TEXT_TYPE_CONTENT, content, succeededId,
                     total_files) != NOTIFICATION_ERROR_NONE ||
        !attachLaunchRequest(notification, NOTI_STATE_SENT, OldFigures::remove,
                             WithoutRequest::give_up, "app_control_create failed!") ||
        setDisplay(notification, displayTray) != NOTIFICATION_ERROR_NONE)
        return false;
    const int err = _notificationInsert(notification, NOTI_STATE_SENT);
    if (err != NOTIFICATION_ERROR_NONE)
        LOG_ERROR("_notificationInsert failed [%d]", err);
    return err == NOTIFICATION_ERROR_NONE;
}

bool _postFailed(notification_h notification, int error_code)
{
    const bool server = _isServerError(error_code);
    const int state_code = server ? NOTI_STATE_FAILED_SERVER : NOTI_STATE_FAILED_DEVICE;
    if (setLayout(notification, NOTIFICATION_LY_NOTI_EVENT_MULTIPLE) != NOTIFICATION_ERROR_NONE ||
        setImages(notification, panelIcon, indicatorIcon) != NOTIFICATION_ERROR_NONE)
        return false;
    LOG_DEBUG("Updating notification with text <%s>", translated(failedId));
    if (setText(notification, NOTIFICATION_TEXT_TYPE_TITLE, failedId) != NOTIFICATION_ERROR_NONE ||
        setText(notification, NOTIFICATION_TEXT_TYPE_CONTENT,
                server ? serverErrorId : deviceErrorId) != NOTIFICATION_ERROR_NONE ||
        !attachLaunchRequest(notification, state_code, OldFigures::none, WithoutRequest::give_up,
                             noRequestText))
        return false;
    const int err = _notificationInsert(notification, state_code);
    if (err != NOTIFICATION_ERROR_NONE)
        LOG_ERROR("_notificationInsert failed [%d]", err);
    return err == NOTIFICATION_ERROR_NONE;
}

} // namespace

bool _isServerError(int error_code)
{
    return error_code == errorServerFirst || error_code == errorServerSecond ||
           error_code == PELLIKO_ERROR_SERVICE_NOT_RUNNING;
}

void addProgressNotification(int kind, notification_h *notification_ref)
{
    notification_h notification = notification_create(NOTIFICATION_TYPE_ONGOING);
    replaceNotificationHandle(notification_ref, notification);
    if (!notification) {
        LOG_ERROR("Notification is NULL");
        return;
    }
    if (kind == 0 && !_showPreparing(notification))
        return;
    if (setDisplay(notification, displayTray) != NOTIFICATION_ERROR_NONE)
        return;
    if (kind != 3)
        attachLaunchRequest(notification, NOTI_STATE_PREPARING, OldFigures::none,
                            WithoutRequest::go_on, noRequestText);
    const int err = _notificationInsert(notification, NOTI_STATE_PREPARING);
    if (err == NOTIFICATION_ERROR_NONE)
        LOG_DEBUG("_notificationInsert success");
    else
        LOG_ERROR("_notificationInsert failed [%d]", err);
}

int updateUploadNotificationSendingStatus(PellikoAppData * /*ad*/, int progress_percent,
                                          notification_h *notification_ref,
                                          const char *noti_priv_id)
{
    if (!*notification_ref || !g_current_node)
        return 0;
    std::string title;
    if (!readTitle(*notification_ref, title))
        return 0;
    if (title.empty()) {
        LOG_ERROR("notification get text error = %s", get_error_message(TIZEN_ERROR_NO_DATA));
        return 0;
    }
    if (titleIs(title, preparingId) || titleIs(title, pausedId)) {
        LOG_DEBUG("Uploading stage is preparing or paused");
        deleteNotificationById(notification_ref, noti_priv_id);
        LOG_DEBUG("Adding sending noti...");
        if (!_buildSending(notification_ref))
            return 0;
    }
    return _moveBar(*notification_ref, progress_percent);
}

void addPausedNotification(UploadNotiData *node, int status)
{
    if (!node || !node->notif || status != PELLIKO_UPLOAD_STATUS_PAUSED)
        return;
    std::string title;
    if (!readTitle(node->notif, title))
        return;
    if (titleIs(title, pausedId)) {
        LOG_DEBUG("Already Paused.. returning");
        return;
    }
    if (deleteNotificationById(&node->notif, node->noti_priv_id) == 0) {
        LOG_DEBUG("Already preparing to upload.. returning");
        return;
    }
    notification_h notification = notification_create(NOTIFICATION_TYPE_ONGOING);
    replaceNotificationHandle(&node->notif, notification);
    if (!notification)
        LOG_ERROR("fail to create notification box");
    if (notification && _buildPaused(notification))
        return;
    LOG_ERROR("Failure Case...:");
    replaceNotificationHandle(&node->notif, nullptr);
}

void updateUploadNotificationWaitForNoti()
{
    if (g_noti_press_data.upload_status == PELLIKO_UPLOAD_STATUS_SHARE_FINISHED ||
        g_noti_press_data.upload_status == NOTI_STATE_CANCELLED)
        return;
    const PellikoAppData *ad = getAppData();
    RETURN_IF_NULL(ad, "ad is NULL");
    if (_isNotifyingShown())
        return;
    notification_h notification = notification_create(NOTIFICATION_TYPE_ONGOING);
    if (!notification) {
        LOG_ERROR("Notification is NULL");
        return;
    }
    _postNotifying(notification);
    notification_free(notification);
}

void updateUploadNotificationSent(int total_files)
{
    char content[sentContentSize];
    formatTranslated(content, sizeof(content), translated(succeededId), "d", total_files);
    _deleteCurrentNotification();
    notification_h notification = notification_create(NOTIFICATION_TYPE_NOTI);
    if (!notification) {
        LOG_ERROR("Notification is NULL");
        return;
    }
    if (_postSent(notification, content, total_files) &&
        postTicker(NOTIFICATION_LY_NOTI_EVENT_MULTIPLE, translated(sentId), nullptr)) {
        // The resumed upload is done: later figures come from the share in hand again.
        getAppData()->is_resume_by_reboot = 0;
        getAppData()->has_upload_resume = 0;
    }
    notification_free(notification);
}

void uploadAddFailedNotification(PellikoAppData * /*ad*/, int /*status*/, int error_code)
{
    LOG_ERROR("Remote Share Upload error err - %d\n", error_code);
    _deleteCurrentNotification();
    if (error_code == 0)
        return;
    notification_h notification = notification_create(NOTIFICATION_TYPE_NOTI);
    if (!notification) {
        LOG_ERROR("fail to create notification box");
        return;
    }
    // The panel keeps what was posted; the node must not keep a handle that is freed here.
    if (_postFailed(notification, error_code) && g_current_node)
        replaceNotificationHandle(&g_current_node->notif, nullptr);
    notification_free(notification);
}

} // namespace pelliko
