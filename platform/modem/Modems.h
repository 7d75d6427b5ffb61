// The modems of the machine, whichever service has them.
#pragma once

#include "ModemService.h"

#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace pelliko::modem
{

/// The kinds of modem service that are known, the preferred one first.
std::vector<std::unique_ptr<ModemService>> knownServices();

/// The modems of the first service that has any. When no service has one and the account names the
/// user's SIM, one modem called "account" stands in, with that SIM ready. Starts no service. Any
/// thread; blocks for a bounded time.
ModemList currentModems();

/// Whether a SIM of `list` can be used.
bool anySimReady(const ModemList &list);

/// Whether sendThroughModem would use a modem, or cannot tell because a service does not answer.
/// Starts a modem service that is installed but not running. Any thread, blocks for a bounded time.
bool mayHaveModem();

/// Sends through the modem of `slot` (counted from 0): empty on success, else one sentence; nothing
/// when the machine has no modem (the account's SIM is none). Starts a modem service that is
/// installed but not running. Any thread, blocks for a bounded time, needs no main loop.
[[nodiscard]] std::optional<std::string> sendThroughModem(int slot, const std::string &to,
                                                          const std::string &text);

} // namespace pelliko::modem
