// What takes a message away.
#pragma once

#include <string>

namespace pelliko::messaging
{

struct Sms {
    std::string to;
    std::string text; // UTF-8
    int sim;          // SIM slot, 1-based
};

class SmsTransport
{
public:
    virtual ~SmsTransport() = default;

    // Blocks until the message is safely in the transport's hands; empty on success, else one
    // sentence that says what failed. Any thread.
    [[nodiscard]] virtual std::string send(const Sms &sms) = 0;
};

} // namespace pelliko::messaging
