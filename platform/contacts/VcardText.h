// A file of vCards cut into single cards.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace pelliko::contacts
{

struct RawCard {
    size_t line;       ///< of its BEGIN, from 1
    std::string text;  ///< with CRLF line ends, UTF-8; empty when there is an error
    std::string error; ///< why it is no card, or empty
};

/// The text itself when it is UTF-8, else what it says in Windows-1252, which old phones write.
/// Bytes that mean nothing there either become the replacement character.
std::string asUtf8(std::string text);

/// The cards of the text in their order, also those that are broken. What stands outside of cards
/// is left out. See asUtf8 for text that is not UTF-8.
std::vector<RawCard> splitCards(std::string_view text);

} // namespace pelliko::contacts
