// One message through a modem of ModemManager, to its final word.
#pragma once

#include <string>

#include <libmm-glib.h>

namespace pelliko::modem
{

/// Blocks until the network took the message or refused it. Empty on success, else one sentence.
/// Nothing stays in the modem's store, unless the service could no longer be asked to delete it.
[[nodiscard]] std::string sendThrough(MMObject *modem, const std::string &to,
                                      const std::string &text, GCancellable *cancellable);

} // namespace pelliko::modem
