// Where the telephony readiness key gets its value from: the SIMs of the machine.
#pragma once

#include <string>

namespace pelliko::vconf
{

/// Whether the key is one that the modems set.
bool followsModems(const std::string &key);

/// Asks the modem services once and sets the key when their readiness is another than was published
/// last. Any thread; blocks for a bounded time.
void refreshReadiness();

/// Keeps the key up to date from now on. Main loop only; more than one call is one.
void followReadiness();

} // namespace pelliko::vconf
