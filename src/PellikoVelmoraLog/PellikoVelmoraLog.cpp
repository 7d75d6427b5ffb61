#include "PellikoVelmoraLog/PellikoVelmoraLog.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/AppData.h"
#include "PellikoUploadDataManager/SupportedFileTypes.h"
#include "PellikoVelmoraLog/UsageBuckets.h"

#include <algorithm>
#include <app_control.h>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <mutex>
#include <vector>

namespace pelliko
{

namespace
{

constexpr const char *useAppFeatureUri =
    "content://com.velmora.log.provider/log/use_app_feature_survey";
constexpr const char *appId = "com.velmora.pelliko";
constexpr const char *pickerKey = "ct_app_id"; ///< in whose contact view recipients were picked
constexpr int useAppFeature = 0;               ///< how the trace names records of this kind
constexpr int noRow = 80;                      ///< the position behind the last extension

// Guards the instance's handle, which the main loop and the SMS worker may both find missing.
std::mutex g_handle_mutex;

struct Feature {
    const char *code;
    const char *name; ///< for the trace only
};
constexpr Feature shareVia = {"PK01", "Pelliko_Share via"};
constexpr Feature shareViaTo = {"PK02", "Pelliko_Share via_to"};
constexpr Feature shareViaContents = {"PK03", "Pelliko_Share via_Contents type"};
constexpr Feature shareViaWifiOnly = {"PK04", "Pelliko_Share via_wifionly"};
constexpr Feature shareViaFileCount = {"PK05", "Pelliko_Share via_filecount"};
constexpr Feature shareViaFileSize = {"PK06", "Pelliko_Share via_filesize"};
constexpr Feature shareReject = {"PK07", "Pelliko_Share_reject"};
constexpr Feature shareCancel = {"PK08", "Pelliko_Share_cancel"};
constexpr Feature sendSms = {"PK09", "Pelliko_Send_SMS notification"};
constexpr Feature receiveNotification = {"PK10", "Pelliko_Receive_notification"};

struct BundleFree {
    void operator()(bundle *data) const { bundle_free(data); }
};
using Bundle = std::unique_ptr<bundle, BundleFree>;

struct CFree {
    void operator()(char *text) const { free(text); }
};
using CText = std::unique_ptr<char, CFree>;

void _velmoraLogInsertedCb(int request_id, const char *uri, int error, void *)
{
    LOG_DEBUG("request ID[%d] completed, uri[%s], error[%d]", request_id, textOrNull(uri), error);
}

// Whether a record arrives is nobody's concern here, so no result is looked at.
void _send(velmora_log_manager_h handle, const Feature &feature, const char *extra)
{
    LOG_DEBUG("type: %d, feature: %s [%s], extra: %s, value: %s", useAppFeature, feature.code,
              feature.name, textOrNull(extra), textOrNull(nullptr));
    const Bundle data(bundle_create());
    bundle_add_str(data.get(), "app_id", appId);
    bundle_add_str(data.get(), "feature", feature.code);
    if (extra)
        bundle_add_str(data.get(), "extra", extra);
    int request_id = 0;
    velmora_log_manager_insert(handle, useAppFeatureUri, data.get(), _velmoraLogInsertedCb, nullptr,
                               &request_id);
}

void _sendShareViaTo(velmora_log_manager_h handle, const PellikoAppData *ad, int recipient_count)
{
    char *text = nullptr;
    if (ad)
        app_control_get_extra_data(ad->app_control, pickerKey, &text);
    const CText ct_app_id(text);
    LOG_DEBUG("recipient_count = %d, ct_app_id = %s", recipient_count, textOrNull(text));
    const char *label = _shareViaTo(recipient_count, text);
    LOG_DEBUG("share_via_to: %s", textOrNull(label));
    _send(handle, shareViaTo, label);
}

// One record per kind of content, in the order in which the kinds first occur.
void _sendContents(velmora_log_manager_h handle, const char *const *types, int length)
{
    LOG_DEBUG("contents_types_length = %d", length);
    std::vector<const char *> sent;
    for (int i = 0; types && i < length; ++i) {
        LOG_DEBUG("content_type[%d] = %s", i, textOrNull(types[i]));
        const char *kind = _contentKind(_getFileTypeNumFromFileExtension(types[i]));
        const auto same = [kind](const char *other) { return strcmp(kind, other) == 0; };
        if (!kind || std::any_of(sent.begin(), sent.end(), same))
            continue;
        LOG_DEBUG("### share_via_contents_type: %s", kind);
        _send(handle, shareViaContents, kind);
        sent.push_back(kind);
    }
}

void _sendFigures(velmora_log_manager_h handle, int file_count, uint32_t file_size)
{
    const char *count_bucket = _fileCountBucket(file_count);
    LOG_DEBUG("file_count: %d [%s]", file_count, textOrNull(count_bucket));
    _send(handle, shareViaFileCount, count_bucket);
    const char *size_bucket = _fileSizeBucket(file_size);
    LOG_DEBUG("file_size: %d [%s]", static_cast<int>(file_size), textOrNull(size_bucket));
    _send(handle, shareViaFileSize, size_bucket);
}

} // namespace

int _getFileTypeNumFromFileExtension(const char *extension)
{
    const int row = supportedExtensionRow(extension);
    return row < 0 ? noRow : row;
}

PellikoVelmoraLog::PellikoVelmoraLog(bool &connecting)
{
    connecting = true;
    connect();
}

PellikoVelmoraLog::~PellikoVelmoraLog()
{
    if (handle_)
        velmora_log_manager_destroy(handle_);
}

void PellikoVelmoraLog::connect()
{
    const std::lock_guard lock(g_handle_mutex);
    if (!handle_ && velmora_log_manager_create(&handle_) != TIZEN_ERROR_NONE)
        LOG_ERROR("\033[0;31m* Critical * velmora_log_manager_create failed\033[0;m");
}

PellikoVelmoraLog *PellikoVelmoraLog::getInstance()
{
    bool connecting = false;
    static PellikoVelmoraLog instance(connecting);
    if (!connecting)
        instance.connect();
    return &instance;
}

velmora_log_manager_h PellikoVelmoraLog::handle() const
{
    const std::lock_guard lock(g_handle_mutex);
    return handle_;
}

void PellikoVelmoraLog::insertVelmoraLogShareVia(const PellikoAppData *ad, int recipient_count,
                                                 const char *const *content_types,
                                                 int content_types_length, uint8_t wifi_only,
                                                 int file_count, uint32_t file_size)
{
    _send(handle(), shareVia, nullptr);
    _sendShareViaTo(handle(), ad, recipient_count);
    _sendContents(handle(), content_types, content_types_length);
    if (wifi_only)
        _send(handle(), shareViaWifiOnly, nullptr);
    _sendFigures(handle(), file_count, file_size);
}

void PellikoVelmoraLog::insertVelmoraLogShareReject(int reason)
{
    const char *text = _rejectReason(reason);
    LOG_DEBUG("reject_reason: %s", textOrNull(text));
    _send(handle(), shareReject, text);
}

void PellikoVelmoraLog::insertVelmoraLogShareCancel()
{
    _send(handle(), shareCancel, nullptr);
}

void PellikoVelmoraLog::insertVelmoraLogSendSms()
{
    _send(handle(), sendSms, nullptr);
}

void PellikoVelmoraLog::insertVelmoraLogReceiveNotification()
{
    _send(handle(), receiveNotification, nullptr);
}

} // namespace pelliko
