#include "PellikoUploadManager/UploadStatus.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/AppData.h"
#include "PellikoApp/SharedData.h"
#include "PellikoDatabaseManager/UploadInfoDatabase.h"
#include "PellikoNotificationManager/NotificationPrimitives.h"
#include "PellikoNotificationManager/UploadNotifications.h"
#include "PellikoUploadDataManager/Recipients.h"
#include "PellikoUploadDataManager/UploadNotiData.h"
#include "PellikoUploadManager/ExitPolicy.h"
#include "PellikoUploadManager/HistoryNotice.h"
#include "PellikoUploadManager/UsagePreferences.h"
#include "PellikoUploadingDataManager/PressedNotification.h"

#include <app_preference.h>
#include <cstdio>
#include <cstring>
#include <pelliko_client.h>

namespace pelliko
{

namespace
{

enum class AfterStatus { refresh, done };

// A file of ours lies under the directory; a path that climbs out of it again does not.
bool _isTempFile(const char *path)
{
    const size_t length = strlen(sharedDataDirectory);
    return path && strncmp(path, sharedDataDirectory, length) == 0 &&
           strstr(path + length - 1, "/../") == nullptr;
}

void _pellikoShareDeleteTempFile(const char *path)
{
    if (!_isTempFile(path))
        return;
    LOG_DEBUG("Input_param is matched as temp file path");
    const int ret = remove(path);
    if (ret == 0)
        LOG_DEBUG("Remove file success.");
    else
        LOG_ERROR("Remove file failed [%d]", ret);
}

// The node goes and takes its handle along; the posted notification stays or is gone already.
void _removeCurrentNode()
{
    replaceNotificationHandle(&g_current_node->notif, nullptr);
    removeUploadNotiDataNode(REMOVE_NODE);
}

void _handleError(PellikoAppData *ad, int status, int error_code, int request_id)
{
    deleteUploadDataFromDb(request_id);
    uploadAddFailedNotification(ad, status, error_code);
    _removeCurrentNode();
    _updatePopupPreference(PELLIKO_UPLOAD_STATUS_FAILED, 0.0, error_code);
    safeExit();
    LOG_DEBUG("Ongoing uploads. Can't exit.");
}

AfterStatus _handleProgress(int progress_percent)
{
    const auto percent = static_cast<float>(progress_percent);
    if (g_current_node->progress_percent == percent) {
        LOG_DEBUG("Same progress_percent. Returning...");
        return AfterStatus::done;
    }
    g_current_node->progress_percent = percent;
    return AfterStatus::refresh;
}

void _handleFinished()
{
    LOG_DEBUG("Upload Finished...");
    g_current_node->progress_percent = 100;
    deleteNotificationById(&g_current_node->notif, g_current_node->noti_priv_id);
    updateUploadNotificationWaitForNoti();
}

void _handleCancelled(int request_id)
{
    LOG_DEBUG("File uploading cancelled...");
    deleteNotificationById(&g_current_node->notif, g_current_node->noti_priv_id);
    _removeCurrentNode();
    _updatePopupPreference(PELLIKO_UPLOAD_STATUS_CANCELLED, 0.0, 0);
    deleteUploadDataFromDb(request_id);
}

// The start of the period in which today's bytes are counted, 0.0 when none runs.
double _readTimeLast()
{
    double time_last = 0.0;
    const int ret = preference_get_double(shareTimeLastKey, &time_last);
    if (ret == PREFERENCE_ERROR_NONE)
        return time_last;
    if (ret == PREFERENCE_ERROR_NO_KEY) {
        const int p_err = preference_set_double(shareTimeLastKey, 0.0);
        if (p_err != PREFERENCE_ERROR_NONE)
            LOG_ERROR("Error in setting PREFERENCE KEY SHARE_TIME_LAST, p_err = %d", p_err);
    } else {
        LOG_ERROR("Error in getting PREFERENCE KEY SHARE_TIME_LAST, p_err = %d", ret);
    }
    return 0.0;
}

void _countForToday()
{
    if (_readTimeLast() == 0.0)
        _updateTimestamp();
    _updateUploadedData();
}

void _tellHistory(const PellikoAppData *ad, int request_id)
{
    if (ad->reshared_request_id == 0)
        _sendSharedNotification(request_id);
    else
        _sendResharedNotification(ad->reshared_request_id);
}

// The messages may still be owed when the share is finished; then the process stays for them.
AfterStatus _leaveAfterShare(PellikoAppData *ad)
{
    if (ad->popup)
        return AfterStatus::refresh;
    if (ad->operation_type == OPERATION_SEND_SMS) {
        _hideWindow(ad);
        LOG_DEBUG("waiting for sending SMS under SMS operation");
        return AfterStatus::refresh;
    }
    if (g_has_sms_receiver == 1) {
        LOG_DEBUG("waiting for sending SMS");
        _hideWindow(ad);
        return AfterStatus::refresh;
    }
    LOG_DEBUG("Exit app, no need to wait sending SMS");
    safeExit();
    return AfterStatus::done;
}

AfterStatus _handleShareFinished(PellikoAppData *ad, const char *input_param, int request_id)
{
    _pellikoShareDeleteTempFile(input_param);
    g_current_node->upload_status = PELLIKO_UPLOAD_STATUS_SHARE_FINISHED;
    updateUploadNotificationSent(g_current_node->total_files);
    deleteUploadDataFromDb(request_id);
    _countForToday();
    const bool sms_done = g_current_node->completion_flag == 1;
    _removeCurrentNode();
    _tellHistory(ad, request_id);
    if (sms_done)
        updatePreference();
    return _leaveAfterShare(ad);
}

AfterStatus _handleStatus(PellikoAppData *ad, int status, const char *input_param,
                          int progress_percent, int request_id)
{
    switch (status) {
    case PELLIKO_UPLOAD_STATUS_STARTED:
        LOG_DEBUG("Uploads Started...");
        return AfterStatus::refresh;
    case PELLIKO_UPLOAD_STATUS_PROGRESSING:
        return _handleProgress(progress_percent);
    case PELLIKO_UPLOAD_STATUS_FINISHED:
        _handleFinished();
        return AfterStatus::refresh;
    case PELLIKO_UPLOAD_STATUS_CANCELLED:
        _handleCancelled(request_id);
        return AfterStatus::done;
    case PELLIKO_UPLOAD_STATUS_PAUSED:
        LOG_DEBUG("Upload Paused...");
        addPausedNotification(g_current_node, status);
        return AfterStatus::done;
    case PELLIKO_UPLOAD_STATUS_SHARE_FINISHED:
        return _handleShareFinished(ad, input_param, request_id);
    default:
        return AfterStatus::refresh;
    }
}

void _refresh(PellikoAppData *ad, int status, int progress_percent, int request_id)
{
    if (g_cancel_in_progress == 1)
        return;
    if (status != PELLIKO_UPLOAD_STATUS_FINISHED &&
        status != PELLIKO_UPLOAD_STATUS_SHARE_FINISHED) {
        LOG_DEBUG("Updating = %p", static_cast<void *>(g_current_node->notif));
        updateUploadNotificationSendingStatus(ad,
                                              static_cast<int>(g_current_node->progress_percent),
                                              &g_current_node->notif, g_current_node->noti_priv_id);
    }
    const auto pressed = static_cast<int32_t>(g_noti_press_data.upload_request_id);
    LOG_DEBUG("req_id = %d and g_noti_press_data.upload_request_id = %d", request_id, pressed);
    if (popup_update_enabled == 1 && ad->popup && pressed == request_id)
        _updatePopupPreference(status, progress_percent, 0);
}

} // namespace

void uploadResponseStatusCb(int status, const char *input_param, int progress_percent,
                            int64_t expired_time, int /*unused*/, int error_code, int request_id,
                            void *user_data)
{
    RETURN_IF_NULL(user_data, "user_data is NULL");
    auto *ad = static_cast<PellikoAppData *>(user_data);
    g_current_node = getUploadNotiDataNode(request_id);
    if (!g_current_node) {
        LOG_DEBUG("request id not found");
        return;
    }
    LOG_DEBUG("Status : %d, error_code : %d, req_id : %d", status, error_code, request_id);
    LOG_DEBUG("Percentage : %d", progress_percent);
    LOG_DEBUG("expired_time : %lld", static_cast<long long>(expired_time));
    g_current_node->upload_status = status;
    notePopupDataRequest(request_id);
    if (error_code != 0) {
        _handleError(ad, status, error_code, request_id);
        return;
    }
    if (_handleStatus(ad, status, input_param, progress_percent, request_id) ==
        AfterStatus::refresh)
        _refresh(ad, status, progress_percent, request_id);
}

} // namespace pelliko
