#include "PellikoApp/Operation.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/SmsSender.h"
#include "PellikoApp/Workers.h"
#include "PellikoDatabaseManager/UploadInfoDatabase.h"
#include "PellikoNotificationManager/UploadNotifications.h"
#include "PellikoUploadDataManager/ConfirmationPopup.h"
#include "PellikoUploadDataManager/UploadLimits.h"
#include "PellikoUploadDataManager/UploadNotiData.h"
#include "PellikoUploadManager/ExitPolicy.h"
#include "PellikoUploadManager/UploadStatus.h"

#include <algorithm>
#include <pelliko_client.h>
#include <vector>

namespace pelliko
{

namespace
{

// The ids of the pending uploads as they are now: the passes below remove nodes while they walk.
std::vector<int32_t> _pendingIds()
{
    std::vector<int32_t> ids;
    for (const UploadNotiData *node = g_upload_noti_data_list; node; node = node->next)
        ids.push_back(node->request_id);
    return ids;
}

bool _isToResume(const PellikoAppData *ad, int32_t request_id)
{
    const auto *begin = ad->upload_resume_id_list;
    const auto *end = begin + std::min(ad->upload_resume_count, maxUploadResumeIds);
    return std::find(begin, end, request_id) != end;
}

// The removal acts on g_current_node, which nobody has moved to the node that was found: a node
// that the service no longer knows stays in the list and keeps the application alive.
void _removeExtraNodes(const PellikoAppData *ad)
{
    for (const int32_t request_id : _pendingIds()) {
        if (_isToResume(ad, request_id))
            continue;
        LOG_DEBUG("Removing extra request id = %d", request_id);
        removeUploadNotiDataNode(REMOVE_NODE);
    }
}

void _resumeUpload(PellikoAppData *ad, int32_t request_id)
{
    const int error = pelliko_resume_upload_by_reboot(request_id, uploadResponseStatusCb, ad);
    if (error != PELLIKO_ERROR_NONE) {
        LOG_DEBUG("Upload resume for request id = %d failed with err - %d", request_id, error);
        return;
    }
    LOG_DEBUG("Upload resumes for request id = %d", request_id);
    g_current_node = getUploadNotiDataNode(request_id);
    if (g_current_node)
        addProgressNotification(0, &g_current_node->notif);
}

void _resumeUploads(PellikoAppData *ad)
{
    int32_t not_found = 0;
    for (const int32_t request_id : _pendingIds()) {
        if (_isToResume(ad, request_id)) {
            _resumeUpload(ad, request_id);
            continue;
        }
        LOG_DEBUG("request id not found. Nothing to do.");
        if (++not_found == ad->upload_resume_count) {
            safeExit();
            return;
        }
    }
}

void _resumeFromDatabase(PellikoAppData *ad)
{
    LOG_DEBUG("Reading database...");
    if (!readUploadDataFromDb()) {
        LOG_DEBUG("Database read failed. Cannot resume uploads...");
        safeExit();
        return;
    }
    LOG_DEBUG("Database read successful. Resuming paused uploads...");
    _removeExtraNodes(ad);
    _resumeUploads(ad);
}

void _doDefault(PellikoAppData *ad)
{
    LOG_DEBUG("Default Case...");
    if (ad->is_resume_by_reboot != 1) {
        LOG_DEBUG("No need to action for operation default");
        return;
    }
    LOG_DEBUG("Resume By Reboot");
    if (ad->has_upload_resume == 1)
        _resumeFromDatabase(ad);
    else
        LOG_DEBUG("There is no resume case after reboot");
}

void _doSendSms(PellikoAppData *ad)
{
    LOG_DEBUG("Send SMS to receiver");
    const SmsJob job = makeSmsJob(ad);
    if (startDetachedWorker([job] { runSmsJob(job); }))
        LOG_DEBUG("operation_type=[%d]", ad->operation_type);
    else
        endSmsJob(job, false);
}

void _leaveRefusedShare(PellikoAppData *ad)
{
    ad->wifi_check = 0;
    if (ad->popup) {
        evas_object_del(ad->popup);
        ad->popup = nullptr;
    }
    safeExit();
}

void _doShare(PellikoAppData *ad)
{
    LOG_DEBUG("Operation Share/Multiple Share");
    ad->is_resume_by_reboot = 0;
    if (ad->action_type != ACTION_RESHARE_UPLOAD && checkMaximumTotalUploadExceeded(ad) == -1)
        _leaveRefusedShare(ad);
    else
        bypassContactView(ad);
}

void _doNotiPressed(PellikoAppData *ad)
{
    LOG_DEBUG("Uploading noti pressed");
    popup_update_enabled = 0;
    reopenPopupView(ad);
    popup_update_enabled = 1;
}

} // namespace

void doOperation(PellikoAppData *ad)
{
    RETURN_IF_NULL(ad, "ad is NULL");
    switch (ad->operation_type) {
    case OPERATION_DEFAULT:
        _doDefault(ad);
        break;
    case OPERATION_PUSH:
        LOG_DEBUG("Push notification.");
        break;
    case OPERATION_SEND_SMS:
        _doSendSms(ad);
        break;
    case OPERATION_SHARE:
    case OPERATION_MULTI_SHARE:
        _doShare(ad);
        break;
    case OPERATION_UPLOADING_NOTI_PRESSED:
        _doNotiPressed(ad);
        break;
    default:
        break;
    }
}

} // namespace pelliko
