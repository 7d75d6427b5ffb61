// The SIM of the phone: the slot that messages leave by, and the country that recipients' numbers
// are meant in. Main loop only.
#pragma once

#include "PellikoApp/AppData.h"

#include <vconf.h>

namespace pelliko
{

/// Reads slot and country code into the record, or waits until telephony is ready.
void startTelephony(PellikoAppData *ad);

/// Opens one handle for each modem name, at most three; handles that are open stay.
void _initializeTelephony(PellikoAppData *ad);

/// Finds ad->sender_ccc by the SIM in slot `index`, once in the life of the process.
/// @return 0, also for a SIM of an unknown country; -1: no such slot, no modem in it, or no SIM
int _getCcc(PellikoAppData *ad, int index);

/// Change callback of the readiness key, with the record as its data: opens the handles, or closes
/// them and forgets the modem names. It leaves ad->sim_index as it is.
void _telReadyCb(keynode_t *key, void *data);

} // namespace pelliko
