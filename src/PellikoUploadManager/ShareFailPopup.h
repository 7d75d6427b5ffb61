// The popup that tells that the upload service is still starting. Main loop only.
#pragma once

namespace pelliko
{

class PellikoAppData;

/// Shows the popup on the main window. It is not `ad->popup`: its button and the back key delete it
/// and ask the exit policy. Nothing without a record or a window.
void createShareFailPopup(PellikoAppData *ad);

} // namespace pelliko
