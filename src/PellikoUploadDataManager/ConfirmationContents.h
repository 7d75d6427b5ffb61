// What stands inside the confirmation popup: texts, recipients, check box. Main loop only.
#pragma once

#include <Evas.h>

namespace pelliko
{

class PellikoAppData;

/// Fills the content layout with everything but the popup's buttons. The check box starts with
/// `wifi_only`, which also becomes `ad->wifi_check`.
void addConfirmationContents(PellikoAppData *ad, Evas_Object *layout, bool wifi_only);

/// Writes the texts that depend on the language: heading, body, summary and the check box's.
void setConfirmationTexts(PellikoAppData *ad, Evas_Object *layout);

} // namespace pelliko
