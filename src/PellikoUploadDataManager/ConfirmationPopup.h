// The popup in which the user confirms a share. Main loop only.
#pragma once

namespace pelliko
{

class PellikoAppData;

/// Prepares the recipients of the share in hand and opens the confirmation popup. A null `ad` is
/// logged.
void bypassContactView(PellikoAppData *ad);

/// Builds the popup anew and shows it, window included; a plain share of no bytes starts at once
/// instead. A null `ad` stands for the application record.
void _createPopupView(PellikoAppData *ad);

} // namespace pelliko
