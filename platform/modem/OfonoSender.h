// One message through oFono, to its final word.
#pragma once

#include "ModemService.h"

#include <string>

namespace pelliko::modem
{

/// Hands the message over and waits until oFono calls it sent or failed. Empty on success, else one
/// sentence. Any thread, needs no main loop; ends at the latest after two and a half minutes (oFono
/// itself tries a refused message again for about half a minute).
[[nodiscard]] std::string sendThroughOfono(const Modem &modem, const std::string &to,
                                           const std::string &text);

} // namespace pelliko::modem
