#include "KeptShares.h"

#include "ContactNames.h"

namespace pelliko::companion
{
namespace
{

template <typename Record> void keepCommon(Share &share, const Record &record)
{
    share.state = record.state;
    share.created = record.created;
    share.expires = record.expires;
    share.size = record.total_size;
    for (int i = 0; i < record.file_count; ++i) {
        const pelliko_share_file_s &file = record.files[i];
        share.files.push_back({file.name, file.size, file.type});
    }
}

Recipient keptRecipient(const pelliko_share_recipient_s &recipient)
{
    const std::string number = *recipient.e164 ? recipient.e164 : recipient.number;
    std::string name = nameOfNumberId(recipient.number_id);
    if (name.empty())
        name = nameOfNumber(number);
    return {number, name.empty() ? number : name, recipient.told};
}

} // namespace

SentShare kept(const pelliko_sent_share_s &share)
{
    SentShare copy;
    keepCommon(copy, share);
    copy.id = share.request_id;
    copy.percent = share.percent;
    copy.error = share.error;
    for (int i = 0; i < share.recipient_count; ++i)
        copy.recipients.push_back(keptRecipient(share.recipients[i]));
    return copy;
}

ReceivedShare kept(const pelliko_received_share_s &share)
{
    ReceivedShare copy;
    keepCommon(copy, share);
    copy.token = share.contents_token;
    copy.number = share.sender;
    const std::string name = nameOfNumber(copy.number);
    copy.sender = name.empty() ? copy.number : name;
    return copy;
}

bool isAvailable(const Share &share)
{
    return share.state == PELLIKO_SHARE_AVAILABLE;
}

bool hasEnded(const SentShare &share)
{
    return share.state != PELLIKO_SHARE_UPLOADING && share.state != PELLIKO_SHARE_PAUSED &&
           share.state != PELLIKO_SHARE_NOTIFYING && share.state != PELLIKO_SHARE_WITHDRAWING;
}

} // namespace pelliko::companion
