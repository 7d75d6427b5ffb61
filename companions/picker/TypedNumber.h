// A phone number that is typed rather than found.
#pragma once

#include <string>

namespace pelliko::picker
{

/// The country calling code, in digits, that numbers without one are meant in: that of the user's
/// account, else of the machine's SIM; empty when neither is known. Main loop only.
std::string homeCode();

/// Whether a text is typed as a number: three digits or more of any script, and besides only what
/// numbers are written with.
bool looksLikeNumber(const std::string &typed);

/// The number in international form; empty when it is not one yet.
std::string wholeNumber(const std::string &typed, const std::string &homeCode);

/// Its id in the contacts store, which gets it where it lacks it: nothing but such an id can be
/// shared with. 0 when the store cannot be written.
int numberIdFor(const std::string &number);

} // namespace pelliko::picker
