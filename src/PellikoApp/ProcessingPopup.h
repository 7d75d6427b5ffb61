#pragma once

#include <Evas.h>

namespace pelliko
{

class PellikoAppData;

/// A popup on `ad->win` that says that something goes on, into `ad->processing_popup`, which is
/// nulled when the popup is deleted. `back` is called with `ad` for the back key. Main loop only.
void openProcessingPopup(PellikoAppData *ad, Evas_Smart_Cb back);

} // namespace pelliko
