#pragma once

#include "PellikoApp/AppData.h"

namespace pelliko
{

/// What the exit rule came to.
enum class ExitOutcome {
    popup_open, ///< a popup is open: nothing was changed
    waiting,    ///< uploads are pending: the window was hidden (when there is a record)
    quit        ///< the main loop was asked to end; code after the call still runs
};

/// The one rule that decides between leaving and staying in the background: an open popup stays, a
/// pending upload hides the window, otherwise the main loop ends. `ad` may be null. Main loop only.
ExitOutcome applyExitPolicy(PellikoAppData *ad);

/// applyExitPolicy for the application's record. Returns to its caller in every case.
void safeExit();

/// Lowers and hides the window, deletes the popup and nulls its field, and clears
/// popup_update_enabled: off the screen, still running. Null is ignored.
void _hideWindow(PellikoAppData *ad);

} // namespace pelliko
