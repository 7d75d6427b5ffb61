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

// What became of a message whose sender ended before it had its answer.
enum class Fate { Unknown, Taken, NotTaken };

class SmsTransport
{
public:
    virtual ~SmsTransport() = default;

    // Blocks until the message is safely in the transport's hands; empty on success, else one
    // sentence that says what failed. Any thread.
    [[nodiscard]] virtual std::string send(const Sms &sms) = 0;

    // Known by number and text; the slot is not looked at. Unknown also when the transport cannot
    // be asked. Any thread.
    virtual Fate fateOf(const Sms &sms) = 0;
};

} // namespace pelliko::messaging
