// The texts of an open popup in a new language. Main loop only.
#pragma once

namespace pelliko
{

class PellikoAppData;

/// Re-texts the open popup in the current language; nothing without one.
void updatePopupLanguage(PellikoAppData *ad);

} // namespace pelliko
