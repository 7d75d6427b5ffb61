#include "PellikoUploadingDataManager/PressedNotification.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/CText.h"
#include "PellikoApp/Decimal.h"
#include "PellikoUploadingDataManager/MarkedList.h"
#include "PellikoUploadingDataManager/RecipientPictures.h"

#include <algorithm>

namespace pelliko
{

PressedNotification g_noti_press_data;
uint8_t g_cancel_in_progress = 0;

namespace
{

CText _extra(app_control_h request, const char *key)
{
    char *text = nullptr;
    if (app_control_get_extra_data(request, key, &text) != APP_CONTROL_ERROR_NONE)
        return nullptr;
    return CText(text);
}

void _readNumber(app_control_h request, const char *key, int32_t &number)
{
    if (const CText text = _extra(request, key))
        number = decimalValue(text.get());
}

void _readRequestId(app_control_h request, uint32_t &id)
{
    if (const CText text = _extra(request, "upload_request_id"))
        id = static_cast<uint32_t>(
            std::clamp<long long>(strtoll(text.get(), nullptr, 10), 0, UINT32_MAX));
}

void _readRecipients(app_control_h request, std::vector<std::string> &recipients)
{
    const CText text = _extra(request, "recipient_list");
    if (!text)
        return;
    recipients = splitMarkedList(text.get());
    const auto count = static_cast<size_t>(std::max(pressedRecipientCount(), 0));
    if (recipients.size() > count)
        recipients.resize(count);
}

} // namespace

void getUploadData(app_control_h request)
{
    PressedNotification &data = g_noti_press_data;
    data.upload_status = -1;
    if (const CText count = _extra(request, "recipient_count"))
        data.recipient_count = count.get();
    _readNumber(request, "upload_status", data.upload_status);
    _readNumber(request, "total_files", data.total_files);
    _readNumber(request, "total_size", data.total_size);
    _readRequestId(request, data.upload_request_id);
    _readRecipients(request, data.recipients);
    LOG_DEBUG("Extra data read from notification");
    LOG_DEBUG("Recipient count = %s", data.recipient_count.c_str());
    LOG_DEBUG("Upload status = %d", data.upload_status);
    LOG_DEBUG("Total files = %d", data.total_files);
    LOG_DEBUG("upload_request_id = %u", data.upload_request_id);
    LOG_DEBUG("total_size = %ld", static_cast<long>(data.total_size));
    data.pictures = _populateRecipientThumbnailsFromNumIds(request);
}

int32_t pressedRecipientCount()
{
    return decimalValue(g_noti_press_data.recipient_count.c_str());
}

} // namespace pelliko
