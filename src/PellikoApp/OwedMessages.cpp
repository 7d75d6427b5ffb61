#include "PellikoApp/OwedMessages.h"

#include "AppLog/AppLog.h"

#include <msg_fate.h>
#include <utility>

namespace pelliko
{

OwedMessages::OwedMessages(const std::string &key, msg_handle_t handle, std::string text)
    : handle_(handle), text_(std::move(text)), journalled_(!key.empty()),
      journal_(journalled_ ? SmsJournal::open(key) : nullptr)
{
}

bool OwedMessages::take(const std::string &number)
{
    if (!journalled_)
        return true;
    const auto entry = journal_ ? journal_->find(number) : std::nullopt;
    const bool known = entry.has_value();
    const bool owed = known && isOwed(number, *entry);
    const bool begun = owed && journal_->begin(number, text_);
    // A message that cannot be noted could go out twice: it waits until it can.
    if (!known || begun != owed)
        complete_ = false;
    return begun;
}

bool OwedMessages::isOwed(const std::string &number, const SmsEntry &entry)
{
    if (entry.state == SmsState::none)
        return true;
    if (entry.state == SmsState::sending)
        return isOwedAfterAll(number, entry.text);
    LOG_DEBUG("This message was settled before: state = %d", static_cast<int>(entry.state));
    return false;
}

// Whoever sent it was killed between giving it away and noting its end.
bool OwedMessages::isOwedAfterAll(const std::string &number, const std::string &text)
{
    switch (msg_sms_fate(handle_, number.c_str(), text.c_str())) {
    case MSG_FATE_NOT_TAKEN:
        LOG_DEBUG("This message was interrupted before it was sent");
        return true;
    case MSG_FATE_TAKEN:
        LOG_DEBUG("This message was sent before the interruption");
        note(number, SmsState::sent);
        return false;
    case MSG_FATE_UNKNOWN:
        break;
    }
    LOG_ERROR(
        "This message was interrupted, nobody knows whether it was sent; it is not sent again");
    note(number, SmsState::unknown);
    return false;
}

void OwedMessages::settle(const std::string &number, bool sent)
{
    if (journal_)
        note(number, sent ? SmsState::sent : SmsState::failed);
}

void OwedMessages::note(const std::string &number, SmsState state)
{
    if (!journal_->settle(number, state))
        complete_ = false;
}

} // namespace pelliko
