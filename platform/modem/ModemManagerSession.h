// A short conversation with ModemManager.
#pragma once

#include <string>
#include <vector>

#include <libmm-glib.h>

namespace pelliko::modem
{

/// Lives on one thread, within one function: until it is destroyed it is the thread's default
/// context, so that what the library schedules never waits for the main loop.
class ModemManagerSession
{
public:
    /// Blocks until the service has told its modems or `cancellable` ends it. Starts no service.
    explicit ModemManagerSession(GCancellable *cancellable);
    ~ModemManagerSession();
    ModemManagerSession(const ModemManagerSession &) = delete;
    ModemManagerSession &operator=(const ModemManagerSession &) = delete;

    /// Whether the service is on the system bus; without a bus it is not.
    bool present() const { return present_; }
    /// One sentence when the service is there but could not be asked.
    const std::string &error() const { return error_; }
    /// In the lasting order of the slots; borrowed.
    const std::vector<MMObject *> &modems() const { return modems_; }

private:
    void ask(GCancellable *cancellable);

    GMainContext *context_;
    MMManager *manager_ = nullptr;
    GList *objects_ = nullptr;
    std::vector<MMObject *> modems_;
    bool present_ = false;
    std::string error_;
};

/// What went wrong in words for a person, without the bus's own names.
std::string sentence(const char *action, const GError *error);

} // namespace pelliko::modem
