// The simulated phone of a world that was made with a modem, and the real ofonod behind it.
#pragma once

#include <JsonValue.h>
#include <functional>
#include <gio/gio.h>
#include <string>
#include <vector>

namespace phone
{

constexpr const char *kFirstImsi = "262011234567890";
constexpr const char *kSecondImsi = "310150123456789";

/// Sends a command to the phone (see scripts/lib/phonesim.py) and returns its answer, "ok" when it
/// was done.
std::string tell(const std::string &command);

/// The messages that the network has taken since the last call of forgetMessages().
std::vector<pelliko::test::JsonValue> messages();
void forgetMessages();

/// Turns GLib's default main context until the condition holds; false when it does not in time.
bool turnUntil(const std::function<bool()> &condition, unsigned seconds = 20);

/// A second oFono for answers on which the real one ends itself. It has one modem and stands on the
/// bus instead of the phone's.
class OfonoDouble
{
public:
    OfonoDouble();
    ~OfonoDouble();
    OfonoDouble(const OfonoDouble &) = delete;
    OfonoDouble &operator=(const OfonoDouble &) = delete;

    bool isReady() const { return process_ != nullptr; }
    /// A property of the first modem's SIM.
    void setSim(const char *property, GVariant *value);
    void addModem(const char *name);
    /// Gives the modem one data connection, up or down.
    void setConnection(const char *modem, bool up);

private:
    static void call(const char *path, const char *interface, const char *method,
                     GVariant *arguments);

    GSubprocess *process_ = nullptr;
};

} // namespace phone
