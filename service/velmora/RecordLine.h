// One record as a line of JSON.
#pragma once

#include <ctime>
#include <optional>
#include <string>

#include "bundle.h"

namespace pelliko::velmora
{

/// {"time":"2026-05-05T12:00:00Z","uri":"/log/…","app_id":"…",…} and a newline; keys that the
/// bundle does not have are left out. Nothing when the URI has no path or the bundle is empty or
/// has a key that the log does not know. Text that is no UTF-8 is repaired.
std::optional<std::string> recordLine(const char *uri, bundle *data, std::time_t now);

} // namespace pelliko::velmora
