// SIMs, countries and numbers, as far as signing in needs them.
#pragma once

#include <string>

namespace pelliko::korrin
{

/// The IMSI of the first SIM of this machine that can be read; empty without one. Asks the modem
/// service, which may take a moment. Main loop only.
std::string machineImsi();

/// A stand-in for the SIM of an account on a machine without one: the country of the number, the
/// network 00 and the number's last ten digits. "001", the code of test networks, for a country
/// that is not known. Empty when the installation lacks the tables of countries; the log then says
/// so. Any thread.
/// @param number in international form
std::string composedImsi(const std::string &number);

/// The country calling code of a SIM, like "49"; empty when the country is not known. Any thread.
std::string callingCodeOf(const std::string &imsi);

/// The number as accounts have it, like "+4915112345678"; empty when it can be none. A number
/// without a country is taken to be of the country of `callingCode`, which may be empty. Any
/// thread.
std::string internationalNumber(const std::string &written, const std::string &callingCode);

} // namespace pelliko::korrin
