#include "PellikoApp/PushInfo.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/CText.h"
#include "PellikoApp/TextFormat.h"
#include "PellikoNotificationManager/ContactNames.h"

#include <cstdio>
#include <glib.h>

namespace pelliko
{

namespace
{

constexpr const char *unknownSender = "default";
constexpr const char *separator = "|";
constexpr size_t recordSize = 1024;

unsigned int _readCount(pelliko_push_info_h info)
{
    unsigned int count = 0;
    const int ret = pelliko_push_info_get_content_info_count(info, &count);
    if (ret != PELLIKO_ERROR_NONE) {
        LOG_ERROR("get thumbnails_count error!! error_code = %d", ret);
        return 0;
    }
    LOG_DEBUG("thumbnails_count = %u", count);
    return count;
}

unsigned long long _readSize(pelliko_push_info_h info, unsigned int count)
{
    unsigned long long total = 0;
    for (unsigned int i = 0; i < count; ++i) {
        uint32_t size = 0;
        const int ret = pelliko_content_info_get_file_size(info, i, &size);
        if (ret != PELLIKO_ERROR_NONE) {
            LOG_ERROR("get size error!! error_code = %d", ret);
            continue;
        }
        LOG_DEBUG("current item size = %u", size);
        total += size;
    }
    return total;
}

unsigned long long _readExpiry(pelliko_push_info_h info)
{
    unsigned long long expired_time = 0;
    const int ret = pelliko_push_info_get_expired_time(info, &expired_time);
    if (ret != PELLIKO_ERROR_NONE)
        LOG_ERROR("get expired time error!! error_code = %d", ret);
    else
        LOG_DEBUG("expired_time = %llu", expired_time);
    return expired_time;
}

std::string _readSender(pelliko_push_info_h info)
{
    char *text = nullptr;
    const int ret = pelliko_push_info_get_sender_msisdn(info, &text);
    const CText number(text);
    return ret == PELLIKO_ERROR_NONE && number ? number.get() : unknownSender;
}

} // namespace

PushInfo::PushInfo(pelliko_push_info_h info)
    : count(_readCount(info)), size(_readSize(info, count)), expired_time(_readExpiry(info)),
      number(_readSender(info)), name(getContactName(number.c_str()))
{
}

PushInfo::~PushInfo()
{
    g_free(name);
}

std::string pushRecord(const PushInfo &info, const char *token)
{
    char record[recordSize];
    const int length =
        snprintf(record, sizeof(record), "%d%s%llu%s%llu%s%s%s%s%s%s", static_cast<int>(info.count),
                 separator, info.size, separator, info.expired_time, separator, info.number.c_str(),
                 separator, textOrNull(info.name), separator, token);
    if (length >= static_cast<int>(sizeof(record)))
        dropBrokenCharacter(record);
    return record;
}

} // namespace pelliko
