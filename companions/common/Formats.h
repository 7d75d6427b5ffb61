// Sizes and dates as a person reads them.
#pragma once

#include <cstdint>
#include <string>

namespace pelliko::companion
{

/// Bytes in decimal units with the locale's decimal mark, "2.4 MB". Less than 0 counts as 0.
std::string sizeText(int64_t bytes);

/// Date and time of day in the locale's form and the local time zone. Without an installed locale
/// `fallback` (a strftime format, from the catalogue) is the form.
/// @param seconds since the epoch
std::string dateText(int64_t seconds, const char *fallback);

} // namespace pelliko::companion
