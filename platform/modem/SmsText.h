// The text of a message as the bus carries it.
#pragma once

#include <string>

namespace pelliko::modem
{

/// `text` as valid UTF-8. A text that was cut at a number of bytes may end inside a character: what
/// is left of that character goes, as a sign in its place would cost every other character half of
/// its room in the message. Other bytes that are no characters become U+FFFD.
std::string wholeCharacters(const std::string &text);

} // namespace pelliko::modem
