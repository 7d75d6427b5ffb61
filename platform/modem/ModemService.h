// What a modem service of the machine can be asked: its modems, their SIMs, and to send a message.
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

namespace pelliko::modem
{

enum class SimState {
    Unknown, ///< the modem is off, or has not told yet
    Missing,
    Locked, ///< asks for a PIN or PUK, or is barred
    Ready,
};

struct Modem {
    std::string name; ///< lasting name: the modem's object path
    SimState sim = SimState::Unknown;
    std::string imsi;  ///< what the service says, unchecked; empty when it says nothing
    int mncLength = 0; ///< digits of the network code in `imsi`, 2 or 3; 0 when not known
};

struct ModemList {
    /// In a lasting order; the place in the list is the SIM slot, counted from 0.
    std::vector<Modem> modems;
    /// Slot of the modem that carries the data connection; -1 when not known.
    int dataModem = -1;
    /// One sentence when the service is on the bus but could not be asked (`modems` is then empty).
    std::string error;
};

/// One kind of modem service on the system bus. Objects keep no state about modems: every question
/// goes to the service. Apart from listen() every function may be called on any thread, several
/// threads at the same time, blocks for a bounded time and needs no main loop to make progress.
class ModemService
{
public:
    virtual ~ModemService() = default;

    /// The well-known name of the service on the system bus. Static text.
    virtual const char *busName() const = 0;

    /// What the service knows now; nothing when it is not on the bus. Never starts the service.
    virtual std::optional<ModemList> read() = 0;

    /// Calls `changed` on the main loop (GLib's default main context) whenever read() may give
    /// another answer, until the object is destroyed; that the service comes and goes on the bus is
    /// watched by the caller. Once per object, main loop only, does not block.
    virtual void listen(std::function<void()> changed) = 0;

    /// Sends `text` (valid UTF-8, of any length) through the modem of `slot` (counted from 0) and
    /// waits for the service's final word. Empty on success, else one sentence that says what
    /// failed: no such slot, no usable SIM, refused by the network, the service died, no word
    /// within bounded time.
    [[nodiscard]] virtual std::string sendSms(int slot, const std::string &to,
                                              const std::string &text) = 0;
};

} // namespace pelliko::modem
