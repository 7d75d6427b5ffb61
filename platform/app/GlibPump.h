// Lets the toolkit's main loop drive GLib's default main context as well, so that bus calls,
// network and modem events arrive on the one loop. Debian builds EFL without that support.
#pragma once

namespace pelliko::platform
{

/// Puts the pump into Ecore's loop. Main thread, after ecore_init or elm_init; once is enough and
/// more does no harm.
void installGlibPump();

/// Gives Ecore its own waiting function back.
void removeGlibPump();

} // namespace pelliko::platform
