#include "PellikoUploadManager/UsagePreferences.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/AppData.h"
#include "PellikoApp/CText.h"
#include "PellikoApp/Decimal.h"
#include "PellikoUploadDataManager/UploadNotiData.h"
#include "PellikoUploadManager/ExitPolicy.h"
#include "PellikoUploadManager/PeriodClock.h"
#include "PellikoUploadManager/PopupData.h"
#include "PellikoUploadingDataManager/PressedNotification.h"
#include "PellikoUploadingDataManager/StatusPopup.h"

#include <Ecore.h>
#include <app_preference.h>
#include <atomic>
#include <cstdlib>
#include <cstring>
#include <optional>

namespace pelliko
{

namespace
{

std::optional<int> reportedRequest;   ///< whose report is being handled
std::optional<int> handedOverRequest; ///< whose report the text in the store is

void _logPopupData(const PopupData &data)
{
    LOG_DEBUG("status = %d, progress_percent = %f, error_code = %d", data.status,
              data.progress_percent, data.error_code);
}

int _readTotalSize()
{
    int total = 0;
    const int ret = preference_get_int(shareTotalSizeKey, &total);
    if (ret == PREFERENCE_ERROR_NONE)
        return total;
    if (ret == PREFERENCE_ERROR_NO_KEY) {
        const int p_err = preference_set_int(shareTotalSizeKey, 0);
        if (p_err != PREFERENCE_ERROR_NONE)
            LOG_ERROR("Error in setting PREFERENCE KEY SHARE_TOTAL_SIZE, p_err = %d", p_err);
    } else {
        LOG_ERROR("Error in getting PREFERENCE KEY SHARE_TOTAL_SIZE, p_err = %d", ret);
    }
    return 0;
}

CText _readPopupData()
{
    char *text = nullptr;
    const int ret = preference_get_string(updatePopupDataKey, &text);
    if (ret == PREFERENCE_ERROR_NONE)
        return CText(text);
    if (ret == PREFERENCE_ERROR_NO_KEY) {
        if (preference_set_string(updatePopupDataKey, "") == PREFERENCE_ERROR_NONE)
            return CText(strdup(""));
        LOG_ERROR("Error in setting PREFERENCE KEY SHARE_UPDATE_POPUP_DATA");
    } else {
        LOG_ERROR("Error in getting PREFERENCE KEY SHARE_UPDATE_POPUP_DATA");
    }
    return nullptr;
}

bool _isAboutPressed()
{
    return !handedOverRequest ||
           *handedOverRequest == static_cast<int32_t>(g_noti_press_data.upload_request_id);
}

// The SMS event of the share that the record names; true when that share is now complete.
bool _noteSmsDone(const PellikoAppData *ad)
{
    const int32_t req_id = decimalValue(ad->req_id);
    LOG_DEBUG("req_id = %d", req_id);
    UploadNotiData *node = getUploadNotiDataNode(req_id);
    if (!node)
        return false;
    if (node->completion_flag == 1)
        return true;
    node->completion_flag = 1;
    return false;
}

// What the store would have told in a later turn of the loop.
void _tellSmsDone(void *)
{
    ecore_job_add([](void *) { _preferenceUpdatedCb(shareSmsDoneKey, nullptr); }, nullptr);
}

} // namespace

void updatePreference()
{
    static std::atomic<bool> listening = false;
    if (preference_set_changed_cb(shareSmsDoneKey, _preferenceUpdatedCb, nullptr) ==
        PREFERENCE_ERROR_NONE)
        listening = true;
    const int p_err = preference_set_int(shareSmsDoneKey, 1);
    if (p_err != PREFERENCE_ERROR_NONE)
        LOG_ERROR("Error in setting PREFERENCE SHARE_SMS_DONE with sms_done = 1, p_err = %d",
                  p_err);
    else
        LOG_DEBUG("Updating preference for sms_done with value = 1");
    // The process would wait for a change that nobody tells.
    if (!listening || p_err != PREFERENCE_ERROR_NONE)
        ecore_main_loop_thread_safe_call_async(_tellSmsDone, nullptr);
}

void _updateTimestamp()
{
    const double now = periodSeconds();
    if (preference_set_double(shareTimeLastKey, now) != PREFERENCE_ERROR_NONE)
        LOG_ERROR("Error in setting PREFERENCE KEY SHARE_TIME_LAST");
    else
        LOG_DEBUG("Updating preference for share_time_last with value = %f", now);
}

void _updateUploadedData()
{
    RETURN_IF_NULL(g_current_node, "g_current_node is NULL");
    const auto before = static_cast<uint32_t>(_readTotalSize());
    const auto added = static_cast<uint32_t>(g_current_node->total_size);
    const auto total = static_cast<int32_t>(before + added);
    const int p_err = preference_set_int(shareTotalSizeKey, total);
    if (p_err != PREFERENCE_ERROR_NONE)
        LOG_ERROR(
            "Error in setting PREFERENCE SHARE_TOTAL_SIZE with share_total_size = %f, p_err = %d",
            static_cast<double>(total), p_err);
    else
        LOG_DEBUG("Updating preference for share_total_size with value = %ld",
                  static_cast<long>(total));
}

void notePopupDataRequest(int request_id)
{
    reportedRequest = request_id;
}

void _updatePopupPreference(int status, double progress_percent, int error_code)
{
    _logPopupData({status, progress_percent, error_code});
    const CText previous = _readPopupData();
    LOG_DEBUG("previous update_popup_data = %s", textOrNull(previous.get()));
    preference_set_changed_cb(updatePopupDataKey, _popupDataPreferenceUpdatedCb, nullptr);

    const auto text = popupDataText({status, progress_percent, error_code});
    LOG_DEBUG("new update_popup_data = %s", text.data());
    handedOverRequest = reportedRequest;
    if (preference_set_string(updatePopupDataKey, text.data()) == PREFERENCE_ERROR_NONE)
        LOG_DEBUG("PREFERENCE KEY SHARE_UPDATE_POPUP_DATA updated.");
    else
        LOG_ERROR("Error in getting PREFERENCE KEY SHARE_UPDATE_POPUP_DATA");
}

void _popupDataPreferenceUpdatedCb(const char * /*key*/, void * /*user_data*/)
{
    char *value = nullptr;
    if (preference_get_string(updatePopupDataKey, &value) != PREFERENCE_ERROR_NONE)
        LOG_ERROR("Error in getting PREFERENCE KEY SHARE_UPDATE_POPUP_DATA, Popup cannot be "
                  "updated.");
    const CText text(value);
    LOG_DEBUG("update_popup_data = %s", textOrNull(text.get()));
    const PopupData data = parsePopupData(text.get());
    _logPopupData(data);
    if (_isAboutPressed())
        updatePopupStatus(data.status, data.progress_percent, data.error_code);
}

void _preferenceUpdatedCb(const char * /*key*/, void * /*user_data*/)
{
    PellikoAppData *ad = getAppData();
    // Only an open popup leaves the question unanswered: it is asked again below.
    if (ad && _noteSmsDone(ad) && applyExitPolicy(ad) != ExitOutcome::popup_open)
        return;
    applyExitPolicy(ad);
}

} // namespace pelliko
