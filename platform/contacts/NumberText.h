// Forms of a text under which the store finds it.
#pragma once

#include <string>
#include <string_view>

namespace pelliko::contacts
{

/// The text without differences of case and of composed or decomposed letters. Bytes that are not
/// UTF-8 become the replacement character.
std::string foldText(std::string_view text);

/// A phone number without its formatting: digits (of any script, as 0 to 9), "*", "#" and one
/// leading
/// "+". Empty when nothing of that is in it.
std::string cleanNumber(std::string_view number);

/// cleanNumber with the international prefix "00" written as "+". No country code is guessed.
std::string normalizeNumber(std::string_view number);

} // namespace pelliko::contacts
