#pragma once

#include "PellikoApp/AppData.h"

namespace pelliko
{

/// Does what ad->operation_type says; a value above 6 does nothing. Main loop only.
void doOperation(PellikoAppData *ad);

} // namespace pelliko
