#pragma once

#include "PellikoDatabaseManager/SmsJournal.h"

#include <memory>
#include <msg.h>
#include <string>

namespace pelliko
{

/// Which messages of a share are still to be sent. With a journal each goes out at most once,
/// however often the share's messages are asked for and whoever is killed meanwhile; what nobody
/// can tell the fate of is left out. Used by one worker.
class OwedMessages
{
public:
    /// @param key of the share in the journal; empty: no journal, everything is owed
    /// @param handle stays the caller's
    OwedMessages(const std::string &key, msg_handle_t handle, std::string text);

    /// Whether the message to that number is to be sent now. When it is, settle() follows.
    bool take(const std::string &number);
    void settle(const std::string &number, bool sent);

    /// Whether every message that was asked for so far has an end that will be remembered.
    bool complete() const { return complete_; }

private:
    bool isOwed(const std::string &number, const SmsEntry &entry);
    bool isOwedAfterAll(const std::string &number, const std::string &text);
    void note(const std::string &number, SmsState state);

    msg_handle_t handle_;
    std::string text_;
    bool journalled_;
    std::unique_ptr<SmsJournal> journal_;
    bool complete_ = true;
};

} // namespace pelliko
