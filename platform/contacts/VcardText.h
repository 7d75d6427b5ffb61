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

/// The cards of the text in their order, also those that are broken. What stands outside of cards
/// is left out. Text that is not UTF-8 is taken as Windows-1252, which old phones write.
std::vector<RawCard> splitCards(std::string_view text);

} // namespace pelliko::contacts
