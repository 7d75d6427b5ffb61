// What a tap does.
#pragma once

#include <gio/gio.h>

#include "Record.h"

namespace pelliko::quickpanel
{

// Sends the stored launch request to its application, which the bus starts when it does not run.
// Returns at once: an application that is starting may itself be waiting for the panel. A failure
// is written to standard error, nobody is there to be told.
void launch(GDBusConnection *bus, const notification::Record &record);

} // namespace pelliko::quickpanel
