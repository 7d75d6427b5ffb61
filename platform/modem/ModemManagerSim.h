// What ModemManager says about the SIM of a modem.
#pragma once

#include "ModemService.h"

#include <libmm-glib.h>

namespace pelliko::modem
{

/// Whether the modem's SIM is there and unlocked: Ready, though its IMSI may not have been read
/// yet. From what the modem has told already; does not block.
SimState simAccess(MMModem *modem);

/// The modem with its SIM, which is asked for its numbers; a SIM that does not tell an IMSI in
/// time, or has not read it yet, is Unknown. Blocks.
Modem describe(MMObject *object, GCancellable *cancellable);

} // namespace pelliko::modem
