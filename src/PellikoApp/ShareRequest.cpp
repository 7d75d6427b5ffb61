#include "PellikoApp/ShareRequest.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/Decimal.h"
#include "PellikoApp/SharedData.h"
#include "PellikoApp/TextArray.h"
#include "PellikoApp/TextFormat.h"
#include "PellikoUploadDataManager/SupportedFileTypes.h"
#include "PellikoUploadManager/ExitPolicy.h"
#include "PellikoVelmoraLog/PellikoVelmoraLog.h"

#include <Ecore_File.h>
#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <fcntl.h>
#include <glib.h>
#include <notification.h>
#include <string>
#include <unistd.h>

namespace pelliko
{

namespace
{

constexpr const char *uploadResumeKey = "upload_resume";
constexpr const char *typeNotSupportedId = "IDS_RSH_TPOP_CANT_SHARE_FILES_FILE_TYPE_NOT_SUPPORTED";
constexpr const char *deviceErrorId =
    "IDS_RSH_BODY_UNABLE_TO_UPLOAD_FILES_A_DEVICE_ERROR_HAS_OCCURRED_ABB";
constexpr int notSupportedReason = 2; ///< of a refused share in the usage log
constexpr size_t toastSize = 512;
constexpr size_t memoPathSize = 128;
constexpr size_t pathSize = 1025;
constexpr int schemeSlashes = 2; // what follows the colon of "file:" before the path begins

void _postToast(const char *id)
{
    char text[toastSize];
    copyText(text, sizeof(text), translated(id));
    notification_status_message_post(text);
}

void _refuseUnsupportedType(const char *message)
{
    LOG_DEBUG("%s", message);
    _postToast(typeNotSupportedId);
    PellikoVelmoraLog::getInstance()->insertVelmoraLogShareReject(notSupportedReason);
    safeExit();
}

void _appendFile(UploadItem &item, const char *path)
{
    appendUploadFile(item, path, _getFileSize(path));
}

// An element of the array: a plain path is taken when its type is supported and it is not empty.
void _appendElement(PellikoAppData *ad, app_control_h request, const char *element)
{
    if (g_str_has_prefix(element, "file")) {
        _parseFileUri(ad, request, element);
    } else if (g_str_has_prefix(element, "/")) {
        if (isSupportedFileType(element) && _getFileSize(element) >= 1)
            _appendFile(*ad->upload_item, element);
        else
            ++unsupported_file_count;
    }
}

void _appendElements(PellikoAppData *ad, app_control_h request, const TextArray &paths)
{
    clearUploadFiles(*ad->upload_item);
    for (int i = 0; i < paths.length(); ++i) {
        if (paths[i])
            _appendElement(ad, request, paths[i]);
        else
            LOG_DEBUG("Array value[%d] doesn't exist", i);
    }
}

std::string _memoPath()
{
    const time_t now = time(nullptr);
    struct tm local = {};
    localtime_r(&now, &local);
    char stamp[32];
    strftime(stamp, sizeof(stamp), "%Y%m%d_%H%M%S", &local);
    char path[memoPathSize];
    snprintf(path, sizeof(path), "%smemo_%s.txt", sharedDataDirectory, stamp);
    return path;
}

bool _writeAll(int fd, const char *text, size_t length)
{
    while (length > 0) {
        const ssize_t written = write(fd, text, length);
        if (written < 0)
            return false;
        text += written;
        length -= static_cast<size_t>(written);
    }
    return true;
}

void _writeMemo(const char *path, const char *text)
{
    const int fd = open(path, O_WRONLY | O_CREAT | O_CLOEXEC, 0644);
    if (fd < 0) {
        LOG_DEBUG("fd open failed");
        return;
    }
    if (!_writeAll(fd, text, strlen(text)))
        LOG_DEBUG("fd write failed");
    close(fd);
}

} // namespace

int64_t _getFileSize(const char *path)
{
    RETURN_VALUE_IF_NULL(path, -1, "path is NULL");
    return ecore_file_size(path);
}

void _parseFileUri(PellikoAppData *ad, app_control_h, const char *uri)
{
    RETURN_IF_NULL(ad, "ad is NULL");
    RETURN_IF_NULL(uri, "uri is NULL");
    RETURN_IF_NULL(ad->upload_item, "upload_item is NULL !!");
    const char *colon = strchr(uri, ':');
    if (!colon) {
        LOG_DEBUG("scheme is NULL");
        return;
    }
    const char *rest = colon + 1;
    if (static_cast<int64_t>(strlen(rest)) - schemeSlashes < 1) {
        LOG_DEBUG("len is less than 0 !!");
        return;
    }
    char path[pathSize];
    g_strlcpy(path, rest + schemeSlashes, sizeof(path));
    _appendFile(*ad->upload_item, path);
    if (ad->upload_item->files)
        LOG_DEBUG("files_list exists, count = %u", eina_list_count(ad->upload_item->files));
    else
        LOG_DEBUG("list is empty");
}

int _parseSingleDataPath(const char *uri, PellikoAppData *ad, app_control_h request)
{
    unsupported_file_count = 0;
    RETURN_VALUE_IF_NULL(uri, -1, "uri is NULL");
    RETURN_VALUE_IF_NULL(ad, -1, "ad is NULL");
    freeUploadData(ad->upload_item);
    ad->upload_item = createUploadData();
    RETURN_VALUE_IF_NULL(ad->upload_item, -1, "upload_item is NULL !!");
    if (!isSupportedFileType(uri)) {
        _refuseUnsupportedType("Unsupported file type. Exiting App.");
        return -1;
    }
    UploadItem &item = *ad->upload_item;
    if (g_str_has_prefix(uri, "file"))
        _parseFileUri(ad, request, uri);
    else if (g_str_has_prefix(uri, "/"))
        _appendFile(item, uri);
    if (!item.files) {
        LOG_DEBUG("files list empty");
        return -1;
    }
    item.files_count = static_cast<int32_t>(eina_list_count(item.files));
    LOG_DEBUG("Upload item: file_count = %d, files_size = %ld, before_files_size = %llu",
              item.files_count, static_cast<long>(item.files_size),
              static_cast<unsigned long long>(item.before_files_size));
    return 0;
}

int _parseMultipleDataPath(app_control_h request, PellikoAppData *ad)
{
    unsupported_file_count = 0;
    RETURN_VALUE_IF_NULL(ad, -1, "ad is NULL");
    if (!ad->upload_item)
        ad->upload_item = createUploadData();
    RETURN_VALUE_IF_NULL(ad->upload_item, -1, "upload_item is NULL !!");
    const TextArray paths(request, APP_CONTROL_DATA_PATH);
    LOG_DEBUG("array len = %d, ret = %d ", paths.length(), paths.result());
    if (!paths.readable())
        return 0;
    if (paths.filled())
        _appendElements(ad, request, paths);
    LOG_DEBUG("Total unsupported files are = %d", unsupported_file_count);
    UploadItem &item = *ad->upload_item;
    if (item.files) {
        item.files_count = static_cast<int32_t>(eina_list_count(item.files));
        LOG_DEBUG("Upload item: file_count = %d, files_size = %ld, prepare_files_size = %llu",
                  item.files_count, static_cast<long>(item.files_size),
                  static_cast<unsigned long long>(item.before_files_size));
    } else {
        LOG_DEBUG("files list empty");
    }
    if (item.files_count == 0) {
        _refuseUnsupportedType("All files are unsupported. Exiting App.");
        return -1;
    }
    return 0;
}

char *_createTextUri(app_control_h request, PellikoAppData *)
{
    const std::string path = _memoPath();
    char *memo = nullptr;
    app_control_get_extra_data(request, APP_CONTROL_DATA_TEXT, &memo);
    LOG_DEBUG("memo = %s", textOrNull(memo));
    if (memo)
        _writeMemo(path.c_str(), memo);
    free(memo);
    if (_getFileSize(path.c_str()) == 0) {
        LOG_DEBUG("Unsupported memo type. Exiting App.");
        _postToast(deviceErrorId);
        safeExit();
        return nullptr;
    }
    LOG_DEBUG("MEMO URI = [%s]", path.c_str());
    return g_strdup(path.c_str());
}

void _parseDataTo(PellikoAppData *ad, app_control_h request)
{
    RETURN_IF_NULL(ad, "ad is NULL");
    const TextArray to(request, APP_CONTROL_DATA_TO);
    LOG_DEBUG("data/to array len = %d, ret = %d ", to.length(), to.result());
    if (!to.filled())
        return;
    ad->number_id_count = to.length();
    std::fill(std::begin(ad->number_id_list), std::end(ad->number_id_list), 0);
    for (int i = 0; i < std::min(to.length(), maxNumberIds); ++i) {
        // An element reads "1234|name": the number ends at the bar.
        ad->number_id_list[i] = decimalValue(to[i]);
        LOG_DEBUG("number_id_list[%d]=%d", i, ad->number_id_list[i]);
    }
}

void _parseUploadResume(PellikoAppData *ad, app_control_h request)
{
    RETURN_IF_NULL(ad, "ad is NULL");
    const TextArray ids(request, uploadResumeKey);
    LOG_DEBUG("data/to array len = %d, ret = %d ", ids.length(), ids.result());
    ad->has_upload_resume = ids.filled() ? 1 : 0;
    if (!ids.filled())
        return;
    ad->upload_resume_count = ids.length();
    std::fill(std::begin(ad->upload_resume_id_list), std::end(ad->upload_resume_id_list), 0);
    for (int i = 0; i < std::min(ids.length(), maxUploadResumeIds); ++i) {
        ad->upload_resume_id_list[i] = decimalValue(ids[i]);
        LOG_DEBUG("upload_resume_id_list[%d]=%d", i, ad->upload_resume_id_list[i]);
    }
}

} // namespace pelliko
