// One contact as it comes in from outside.
#pragma once

#include <string>
#include <vector>

namespace pelliko::contacts
{

/// Where a display name came from; higher is better.
enum class NameSource { None = 0, Email = 1, Number = 2, Nickname = 3, Organisation = 4, Name = 5 };

/// Bits of a phone number's type.
enum NumberType : int {
    number_other = 0,
    number_custom = 1,
    number_home = 2,
    number_work = 4,
    number_voice = 8,
    number_fax = 16,
    number_message = 32,
    number_cell = 64,
    number_pager = 128,
};

struct CardNumber {
    std::string number;
    int type = number_other; ///< NumberType bits
    std::string label;       ///< the user's own word for the type, may be empty
    bool is_default = false;
    bool joined = false; ///< marks the number as the sharing service's; false keeps the mark it has
};

struct ContactCard {
    std::string uid; ///< the card's own lasting name, may be empty
    std::string display_name;
    NameSource name_source = NameSource::None;
    std::vector<CardNumber> numbers;
    std::string picture; ///< bytes of an image file; empty keeps the picture that the contact has
};

/// What a person reads for the contact: its name, or else its first number.
inline const std::string &shownName(const ContactCard &card)
{
    return card.display_name.empty() && !card.numbers.empty() ? card.numbers.front().number
                                                              : card.display_name;
}

} // namespace pelliko::contacts
