// Push information: a thread of this library asks the service, one token after the other, and hands
// the answers out.
#include "pelliko_client.h"

#include "PushInfoThread.h"
#include "ServiceProxy.h"
#include "ShareRecords.h"

#include <algorithm>
#include <cstring>
#include <string>
#include <vector>

struct pelliko_push_info_s {
    int error = 0; ///< why nothing is known, else 0
    std::vector<uint32_t> sizes;
    int64_t expires = 0;
    std::string sender;
};

namespace
{
constexpr int invalidParameter = -22;

pelliko_push_info_s read(int error, GVariant *share)
{
    pelliko_push_info_s info;
    pelliko::client::ShareLists lists;
    const pelliko_received_share_s record = pelliko::client::receivedRecord(share, lists);
    info.error = error;
    if (error == 0 && record.state != PELLIKO_SHARE_AVAILABLE) {
        info.error = record.state == PELLIKO_SHARE_EXPIRED ? PELLIKO_SHARES_ERROR_EXPIRED
                                                           : PELLIKO_SHARES_ERROR_WITHDRAWN;
    }
    if (info.error == 0) {
        for (const pelliko_share_file_s &file : lists.files) {
            info.sizes.push_back(static_cast<uint32_t>(std::min<int64_t>(file.size, UINT32_MAX)));
        }
        info.expires = record.expires;
        info.sender = record.sender;
    }
    return info;
}

/** What is wrong with asking an info, 0 when nothing is. */
int faultOf(pelliko_push_info_h info, const void *out)
{
    return !info || !out ? invalidParameter : info->error;
}
} // namespace

int pelliko_push_info_request(const char *contents_token, pelliko_push_info_cb callback,
                              void *user_data)
{
    if (!contents_token || !callback) {
        return invalidParameter;
    }
    pelliko::client::askOnThread(contents_token, [token = std::string(contents_token), callback,
                                                  user_data](int error, GVariant *share) {
        pelliko_push_info_s info = read(error, share);
        callback(info.error, token.c_str(), &info, user_data);
    });
    return PELLIKO_ERROR_NONE;
}

int pelliko_push_info_get_content_info_count(pelliko_push_info_h info, unsigned int *count)
{
    const int fault = faultOf(info, count);
    if (fault == 0) {
        *count = static_cast<unsigned int>(info->sizes.size());
    }
    return fault;
}

int pelliko_content_info_get_file_size(pelliko_push_info_h info, unsigned int index, uint32_t *size)
{
    const int fault = faultOf(info, size);
    if (fault != 0) {
        return fault;
    }
    if (index >= info->sizes.size()) {
        return invalidParameter;
    }
    *size = info->sizes[index];
    return PELLIKO_ERROR_NONE;
}

int pelliko_push_info_get_expired_time(pelliko_push_info_h info, unsigned long long *expired_time)
{
    const int fault = faultOf(info, expired_time);
    if (fault == 0) {
        *expired_time = static_cast<unsigned long long>(info->expires);
    }
    return fault;
}

int pelliko_push_info_get_sender_msisdn(pelliko_push_info_h info, char **msisdn)
{
    const int fault = faultOf(info, msisdn);
    if (fault != 0) {
        return fault;
    }
    if (info->sender.empty()) {
        return PELLIKO_SHARES_ERROR_NOT_FOUND;
    }
    *msisdn = strdup(info->sender.c_str()); // the caller's, for free()
    return *msisdn ? PELLIKO_ERROR_NONE : PELLIKO_SHARES_ERROR_IO;
}
