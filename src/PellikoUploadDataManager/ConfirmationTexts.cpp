#include "PellikoUploadDataManager/ConfirmationTexts.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/AppData.h"
#include "PellikoApp/TextFormat.h"

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <string>

namespace pelliko
{

namespace
{

constexpr double secondsUntilExpiry = 172800;

struct Size {
    float amount;
    const char *unit;
};

// Kilobytes are whole; larger sizes have a fraction.
Size _sizeOf(int32_t bytes)
{
    constexpr double gigabyte = 1 << 30, megabyte = 1 << 20;
    if (bytes / gigabyte >= 1)
        return {static_cast<float>(bytes / gigabyte), "GB"};
    if (bytes / megabyte >= 1)
        return {static_cast<float>(bytes / megabyte), "MB"};
    if ((bytes >> 10) >= 1)
        return {static_cast<float>(bytes >> 10), "KB"};
    return {static_cast<float>(bytes), "B"};
}

// A translated text with one number in it.
std::string _withNumber(const char *format, int number)
{
    char text[popupTextSize];
    formatTranslated(text, sizeof(text), format, "d", number);
    return text;
}

std::string _header(int32_t files_count)
{
    if (files_count == 1)
        return translated("IDS_CMV_HEADER_SHARE_1_FILE");
    return _withNumber(translated("IDS_CMV_HEADER_SHARE_PD_FILES_ABB"), files_count);
}

std::string _unsupportedSentence()
{
    if (unsupported_file_count == 1)
        return translated("IDS_RSH_POP_1_FILE_IS_NOT_SUPPORTED_AND_WILL_NOT_BE_SHARED");
    return _withNumber(translated("IDS_RSH_POP_PD_FILES_ARE_NOT_SUPPORTED_AND_WILL_NOT_BE_SHARED"),
                       unsupported_file_count);
}

const char *_reshareAdvice()
{
    return translated("IDS_RSH_POP_TAP_SHARE_TO_RESHARE_THE_FILES_THAT_ARE_ALREADY_UPLOADED_TO_THE_"
                      "SERVER_WITHOUT_ANY_DATA_CHARGES");
}

const char *_wifiAdvice()
{
    return translated("IDS_RSH_POP_TO_AVOID_ANY_ADDITIONAL_CHARGES_SHARE_YOUR_FILES_VIA_WI_FI_"
                      "ONLY");
}

// What the popup tells about this share, after the summary if that stands in the same text.
std::string _advice(bool reshare)
{
    if (reshare)
        return _reshareAdvice();
    if (unsupported_file_count >= 1)
        return _unsupportedSentence() + " " + _wifiAdvice();
    return _wifiAdvice();
}

// The server keeps a share for two days; only the log tells the date.
std::string _expiryDate()
{
    char seconds[11];
    snprintf(seconds, sizeof(seconds), "%.0f",
             static_cast<double>(time(nullptr)) + secondsUntilExpiry);
    const time_t expiry = static_cast<time_t>(strtoll(seconds, nullptr, 10));
    tm local = {};
    localtime_r(&expiry, &local);
    char date[32];
    strftime(date, sizeof(date), "%d/%m/%Y", &local);
    return date;
}

} // namespace

void getTextForConfirmationPopup(PellikoAppData *ad, char *body, char *summary)
{
    copyText(body, popupTextSize, nullptr);
    copyText(summary, popupTextSize, nullptr);
    if (!ad || !ad->upload_item)
        return;
    const UploadItem &item = *ad->upload_item;
    LOG_DEBUG("ad->upload_item->files_count = %d", item.files_count);
    LOG_DEBUG("ad->upload_item->files_size = %ld", static_cast<long>(item.files_size));
    const bool reshare = ad->action_type == ACTION_RESHARE_UPLOAD;
    const Size size = _sizeOf(item.files_size);
    char amount[64];
    snprintf(amount, sizeof(amount), "%.2f", static_cast<double>(size.amount));
    const std::string bracketed = "(" + std::string(amount) + size.unit + ")";

    if (eina_list_count(item.recipient_list) != 1) {
        const std::string text =
            _header(item.files_count) + bracketed + "<br><br>" + _advice(reshare);
        copyText(body, popupTextSize, text.c_str());
    } else if (!reshare && unsupported_file_count < 1) {
        formatTranslated(body, popupTextSize, _wifiAdvice(), "dss", item.files_count, amount,
                         size.unit);
    } else {
        copyText(body, popupTextSize, _advice(reshare).c_str());
    }
    if (eina_list_count(item.recipient_list) == 1)
        copyText(summary, popupTextSize, (_header(item.files_count) + "<br>" + bracketed).c_str());
    LOG_DEBUG("dget_text = %s and dget_text1 = %s", body, summary);
    LOG_DEBUG("current_time + 2days=%s", _expiryDate().c_str());
}

} // namespace pelliko
