// The SIM that the user's account names, for machines without a modem.
#pragma once

#include <string>

namespace pelliko::modem
{

/// $XDG_CONFIG_HOME/pelliko/account.json (~/.config when the variable is not set). Any thread.
std::string accountFile();

/// The text "imsi" of the account file, unchecked; empty when there is no file or no such text. Any
/// thread.
std::string accountImsi();

} // namespace pelliko::modem
