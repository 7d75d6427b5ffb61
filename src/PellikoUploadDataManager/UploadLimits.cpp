#include "PellikoUploadDataManager/UploadLimits.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/TextFormat.h"
#include "PellikoUploadManager/PeriodClock.h"
#include "PellikoUploadManager/UsagePreferences.h"
#include "PellikoVelmoraLog/PellikoVelmoraLog.h"

#include <app_preference.h>
#include <notification.h>

namespace pelliko
{

namespace
{

constexpr int32_t maxFiles = 100;
constexpr uint64_t tooManyBytes = 1073741824;   ///< of one share
constexpr uint32_t mostBytesOfDay = 2147483646; ///< the last total that leaves room
constexpr double hoursOfPeriod = 24.0;
constexpr double secondsOfHour = 3600.0;
constexpr size_t toastSize = 512;

constexpr const char *emptyShareText = "IDS_RSH_TMBODY_FAILED_TO_SEND_FILES_ABB";
constexpr const char *filesText =
    "IDS_RSH_TPOP_MAXIMUM_NUMBER_OF_FILES_HP1SD_EXCEEDED_DESELECT_P2SD_FILES_AND_TRY_AGAIN";
constexpr const char *bytesText =
    "IDS_RSH_BODY_THE_MAXIMUM_TOTAL_FILE_SIZE_HP1SS_P2SS_HAS_BEEN_EXCEEDED";
constexpr const char *dayText =
    "IDS_RSH_BODY_THE_MAXIMUM_TOTAL_SIZE_OF_FILES_THAT_CAN_BE_SHARED_IN_ONE_DAY_HP1SS_P2SS_HAS_"
    "BEEN_EXCEEDED_TRY_AGAIN_TOMORROW";

double _readTimeLast()
{
    double time_last = 0.0;
    const int ret = preference_get_double(shareTimeLastKey, &time_last);
    if (ret == PREFERENCE_ERROR_NONE)
        return time_last;
    if (ret != PREFERENCE_ERROR_NO_KEY)
        LOG_ERROR("Error in getting PREFERENCE KEY SHARE_TIME_LAST");
    else if (preference_set_double(shareTimeLastKey, 0.0) != PREFERENCE_ERROR_NONE)
        LOG_ERROR("Error in setting PREFERENCE KEY SHARE_TIME_LAST");
    return 0.0;
}

// The key is made as a real number although everybody else keeps an integer in it: until the first
// share is counted, which mends the type, readers meet an error and take 0.
int _readTotalSize()
{
    int total_size = 0;
    const int ret = preference_get_int(shareTotalSizeKey, &total_size);
    if (ret == PREFERENCE_ERROR_NONE)
        return total_size;
    if (ret != PREFERENCE_ERROR_NO_KEY)
        LOG_ERROR("Error in getting PREFERENCE KEY SHARE_TOTAL_SIZE");
    else if (preference_set_double(shareTotalSizeKey, 0.0) != PREFERENCE_ERROR_NONE)
        LOG_ERROR("Error in setting PREFERENCE KEY SHARE_TOTAL_SIZE");
    return 0;
}

void _closePeriod()
{
    if (preference_set_double(shareTimeLastKey, 0.0) != PREFERENCE_ERROR_NONE)
        LOG_ERROR("Error in setting PREFERENCE KEY SHARE_TIME_LAST");
    if (preference_set_int(shareTotalSizeKey, 0) != PREFERENCE_ERROR_NONE)
        LOG_ERROR("Error in setting PREFERENCE KEY SHARE_TOTAL_SIZE");
}

// Reasons of the usage log.
constexpr int shareTooLarge = 0;
constexpr int dayTooLarge = 1;
constexpr int tooManyFiles = 3;

int _refuseFiles(int32_t files_count)
{
    char text[toastSize];
    formatTranslated(text, sizeof(text), translated(filesText), "dd", files_count,
                     files_count - maxFiles);
    PellikoVelmoraLog::getInstance()->insertVelmoraLogShareReject(tooManyFiles);
    notification_status_message_post(text);
    return -1;
}

int _refuseBytes(const char *message, const char *gigabytes, int reason)
{
    char text[toastSize];
    formatTranslated(text, sizeof(text), translated(message), "ss", gigabytes, "GB");
    PellikoVelmoraLog::getInstance()->insertVelmoraLogShareReject(reason);
    notification_status_message_post(text);
    return -1;
}

} // namespace

int _isServerUsageExceeded()
{
    const double now = periodSeconds();
    const double time_last = _readTimeLast();
    const int total_size = _readTotalSize();
    if (time_last == 0.0)
        return 0;
    const double hours = (now - time_last) / secondsOfHour;
    LOG_DEBUG("share_total_size = %d", total_size);
    if (hours < hoursOfPeriod) {
        if (static_cast<uint32_t>(total_size) <= mostBytesOfDay)
            return 0;
        LOG_DEBUG("_isServerUsageExceeded returning true");
        return 1;
    }
    LOG_DEBUG("_isServerUsageExceeded returning false");
    _closePeriod();
    return 0;
}

int checkMaximumTotalUploadExceeded(PellikoAppData *ad)
{
    RETURN_VALUE_IF_NULL(ad, -1, "ad is NULL");
    const UploadItem *item = ad->upload_item;
    RETURN_VALUE_IF_NULL(item, -1, "upload_item is NULL");
    if (item->before_files_size == 0) {
        notification_status_message_post(translated(emptyShareText));
        return -1;
    }
    if (item->files_count > maxFiles)
        return _refuseFiles(item->files_count);
    if (item->before_files_size >= tooManyBytes)
        return _refuseBytes(bytesText, "1", shareTooLarge);
    if (_isServerUsageExceeded() == 1)
        return _refuseBytes(dayText, "2", dayTooLarge);
    LOG_DEBUG("nothing exceeded, can upload!");
    return 0;
}

} // namespace pelliko
