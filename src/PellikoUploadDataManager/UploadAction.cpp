#include "PellikoUploadDataManager/UploadAction.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/AppData.h"
#include "PellikoApp/TextFormat.h"
#include "PellikoNotificationManager/UploadNotifications.h"
#include "PellikoUploadDataManager/RecipientTexts.h"
#include "PellikoUploadDataManager/UploadNotiData.h"
#include "PellikoUploadManager/ExitPolicy.h"
#include "PellikoUploadManager/ShareFailPopup.h"
#include "PellikoUploadManager/UploadStart.h"

#include <notification_status.h>
#include <pelliko_client.h>

namespace pelliko
{

namespace
{

constexpr int32_t refusedRequestId = 0; ///< a node keeps it when the service gave no id

void _onServiceInitializing(PellikoAppData *ad)
{
    g_current_node = g_upload_noti_data_list;
    removeUploadNotiDataNode(REMOVE_NODE);
    createShareFailPopup(ad);
}

void _onStartError(PellikoAppData *ad, int error)
{
    LOG_ERROR("Upload error, ret = %d", error);
    if (error == PELLIKO_ERROR_SERVICE_INITIALIZING) {
        LOG_ERROR("Error - PELLIKO_ERROR_SERVICE_INITIALIZING");
        _onServiceInitializing(ad);
        return;
    }
    notification_status_message_post(
        translated(_isServerError(error)
                       ? "IDS_RSH_BODY_FAILED_TO_UPLOAD_FILES_A_SERVER_ERROR_HAS_OCCURRED_ABB"
                       : "IDS_RSH_TMBODY_FAILED_TO_SEND_FILES_ABB"));
    safeExit();
}

void _showProgress(UploadNotiData *node)
{
    addProgressNotification(0, &node->notif);
    if (node->upload_status == PELLIKO_UPLOAD_STATUS_PAUSED) {
        LOG_DEBUG("REDRAW UPLODING PAUSED");
        g_current_node = node;
        addPausedNotification(node, node->upload_status);
    } else {
        node->upload_status = PELLIKO_UPLOAD_STATUS_PROGRESSING;
    }
}

const UploadNotiData *_lastNode()
{
    const UploadNotiData *node = g_upload_noti_data_list;
    while (node && node->next)
        node = node->next;
    return node;
}

// Without memory for a node nothing was sent and the list is as before; the id is then that of an
// earlier upload, which must not be shown as starting again.
void _onStarted(const UploadNotiData *last_before, int32_t request_id)
{
    if (_lastNode() != last_before) {
        if (UploadNotiData *node = getUploadNotiDataNode(request_id))
            _showProgress(node);
    }
    _uploadListPrintUploadNotiDataList();
}

// The two texts may describe another upload by now: a status report uses the same buffers.
int _startUpload(PellikoAppData *ad)
{
    LOG_DEBUG("Action type is ACTION_UPLOAD");
    _populateExtraData(ad);
    const UploadNotiData *last = _lastNode();
    const int result = uploadStart(ad);
    if (result != PELLIKO_ERROR_NONE)
        _onStartError(ad, result);
    else
        _onStarted(last, ad->upload_item->request_id);
    LOG_DEBUG("uploadStart ret = %d", result);
    return result;
}

int _startReshare(PellikoAppData *ad)
{
    LOG_DEBUG("Action type is ACTION_RESHARE_UPLOAD");
    _populateExtraData(ad);
    const UploadNotiData *last = _lastNode();
    const int result = reshareUploadStart(ad);
    if (result != PELLIKO_ERROR_NONE) {
        _onStartError(ad, result);
    } else {
        if (g_upload_noti_data_list)
            g_upload_noti_data_list->total_files = ad->upload_item->files_count;
        _onStarted(last, ad->reshared_request_id);
    }
    LOG_DEBUG("reshareUploadStart ret = %d", result);
    return result;
}

} // namespace

int _performAction(PellikoAppData *ad)
{
    RETURN_VALUE_IF_NULL(ad, -1, "ad is NULL");
    switch (ad->action_type) {
    case ACTION_UPLOAD:
        return _startUpload(ad);
    case ACTION_RESHARE_UPLOAD:
        return _startReshare(ad);
    default:
        LOG_DEBUG("Action Type Invalid");
        return 0;
    }
}

void dropRefusedUpload()
{
    if (UploadNotiData *node = getUploadNotiDataNode(refusedRequestId)) {
        g_current_node = node;
        removeUploadNotiDataNode(REMOVE_NODE);
    }
    safeExit();
}

} // namespace pelliko
