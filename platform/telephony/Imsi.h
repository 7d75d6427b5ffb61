// Takes a subscriber's number apart.
#pragma once

#include "ITapiSim.h"

#include <optional>
#include <string>

namespace pelliko::telephony
{

/// The parts of `imsi`; nothing when it has other characters than digits, or fewer than a country,
/// a network and one digit of a subscriber need. `mncLength` is 2 or 3; with 0 the country's habit
/// decides. A subscriber number of more than ten digits is cut.
std::optional<TelSimImsiInfo_t> splitImsi(const std::string &imsi, int mncLength);

} // namespace pelliko::telephony
