// The popup in which the user confirms a share, and the frame of the one that shows an upload's
// status. Main loop only.
#pragma once

#include <Evas.h>

namespace pelliko
{

class PellikoAppData;

/// Prepares the recipients of the share in hand and opens the confirmation popup. A null `ad` is
/// logged.
void bypassContactView(PellikoAppData *ad);

/// Opens the popup for the operation in hand, after a tap that of the tapped upload; another popup
/// that is open goes. The cancel button of a tapped upload may be pressed again.
/// @return the content layout, null when no popup could be shown
Evas_Object *reopenPopupView(PellikoAppData *ad);

/// Builds the popup anew and shows it, window included; a plain share of no bytes starts at once
/// instead. A null `ad` stands for the application record.
void _createPopupView(PellikoAppData *ad);

} // namespace pelliko
