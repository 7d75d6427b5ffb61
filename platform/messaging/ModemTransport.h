// The transport of machines with a modem.
#pragma once

#include "SmsTransport.h"

#include <memory>

namespace pelliko::messaging
{

// Sends through the modem of the message's SIM slot. Whether there is a modem is asked for every
// message; while the machine has none, messages go to the other transport.
class ModemTransport : public SmsTransport
{
public:
    explicit ModemTransport(std::unique_ptr<SmsTransport> withoutModem);
    std::string send(const Sms &sms) override;
    // What a modem did with a message that nobody waited for is not known: its service has dropped
    // it, or does not say whether it is still on its way.
    Fate fateOf(const Sms &sms) override;

private:
    std::unique_ptr<SmsTransport> withoutModem_;
};

} // namespace pelliko::messaging
