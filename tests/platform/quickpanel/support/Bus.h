// The session bus as tests use it: waiting for what others do, ending and restarting services.
#pragma once

#include <functional>
#include <string>
#include <vector>

#include <gio/gio.h>

#include "Record.h"
#include "Variant.h"
#include "notification.h"

namespace panel_testing
{

using pelliko::notification::Record;
using pelliko::notification::Variant;

// Runs the default main context until the condition holds; false after twenty seconds.
bool waitUntil(const std::function<bool()> &condition);

// A connection of its own to the session bus, dispatched by the default main context.
class Connection
{
public:
    Connection();
    ~Connection();
    Connection(const Connection &) = delete;
    Connection &operator=(const Connection &) = delete;

    GDBusConnection *get() const { return bus_; }
    // Must succeed: a name that somebody else has is a broken test.
    void own(const char *name);
    Variant call(const char *name, const char *path, const char *interface, const char *method,
                 GVariant *parameters) const;

private:
    GDBusConnection *bus_;
};

// Kills the owner of the name, if there is one, and waits until the bus has seen it go.
void killOwner(const char *name);

// The panel's own record, all applications.
std::vector<Record> posted();
// The names of all events since the panel's store was begun, with their titles: "post Title".
std::vector<std::string> history();
// Empties the panel: nothing posted by this application.
void clearPanel();

// A notification with a title, everything else as it comes.
notification_h make(notification_type_e type, const char *title, const char *tag = nullptr);
void setTitle(notification_h noti, const std::string &title);
std::string titleOf(notification_h noti);

} // namespace panel_testing
