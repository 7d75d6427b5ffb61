// Which mobile country codes a country has, by the machine's list of mobile providers.
#pragma once

#include <string>

namespace pelliko::korrin
{

/// The mobile country code that most networks of a country use: three digits, empty when the
/// country or the list is not there.
/// @param region two capital letters
std::string mobileCodeOf(const std::string &region);

/// The country that uses a mobile country code, as two capital letters, or empty.
std::string regionOfMobileCode(const std::string &mobileCode);

} // namespace pelliko::korrin
