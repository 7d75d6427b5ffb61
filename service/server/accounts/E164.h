// The one form in which accounts keep phone numbers
#pragma once

#include <string_view>

namespace pelliko::server
{

/// A plus, a digit other than zero, 7 to 15 digits in all. Requests have to bring this form:
/// whoever asks knows the country that a number was written in, the server does not.
[[nodiscard]] bool isE164(std::string_view number);

} // namespace pelliko::server
