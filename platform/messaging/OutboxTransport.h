// A transport for machines without a modem: a file that a person or a program can read.
#pragma once

#include "SmsTransport.h"

namespace pelliko::messaging
{

// One JSON object per line: "to", "text", "sim", "time" (ISO 8601, UTC). Any number of processes
// may append.
class OutboxTransport : public SmsTransport
{
public:
    explicit OutboxTransport(std::string path);
    std::string send(const Sms &sms) override;
    Fate fateOf(const Sms &sms) override;

    // $PELLIKO_SMS_OUTBOX, else sms-outbox.jsonl in the platform's state directory.
    static std::string defaultPath();

private:
    std::string path_;
};

} // namespace pelliko::messaging
