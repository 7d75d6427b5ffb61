// The double of ModemManager, as a process on the private system bus.
#pragma once

#include <functional>
#include <string>
#include <vector>

#include <gio/gio.h>
#include <gtest/gtest.h>

namespace modem_testing
{

// Runs the default main context until the condition holds; false after twenty seconds.
bool waitUntil(const std::function<bool()> &condition);

struct Attempt {
    std::string modem, number, text;

    bool operator==(const Attempt &) const = default;
};

class ModemManagerDouble
{
public:
    // Returns when it owns its name.
    ModemManagerDouble();
    // Returns when the process has ended and its name is free.
    ~ModemManagerDouble();
    ModemManagerDouble(const ModemManagerDouble &) = delete;
    ModemManagerDouble &operator=(const ModemManagerDouble &) = delete;

    // All paths are the modems' own. Slot 0 is a modem that does not number its slots.
    std::string addModem(unsigned slot, const std::string &imsi = "262011234567890",
                         const std::string &operatorId = "26201",
                         const std::string &device = "/sys/devices/usb1");
    void removeModem(const std::string &modem);
    void takeSim(const std::string &modem);
    void insertSim(const std::string &modem, const std::string &imsi,
                   const std::string &operatorId);
    void readSim(const std::string &modem, const std::string &imsi, const std::string &operatorId);
    void lock(const std::string &modem, unsigned lock);
    void connect(const std::string &modem, bool connected = true);
    void setState(const std::string &modem, int state, unsigned failedReason = 0);
    void setSignal(const std::string &modem, unsigned percent);
    // succeed, refuse-create, refuse, silent or die
    void setSending(const std::string &how);

    std::vector<Attempt> attempts();
    size_t stored(const std::string &modem);

    // The process stands still, with its name on the bus, until it is woken.
    void freeze();
    void wake();
    void kill();

private:
    GVariant *call(const char *method, GVariant *arguments);
    void tell(const char *method, GVariant *arguments);

    GDBusConnection *bus_;
    GSubprocess *process_;
};

} // namespace modem_testing
