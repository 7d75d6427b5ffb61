// The words of vCards for the types of phone numbers.
#pragma once

#include <array>

#include "ContactCard.h"

namespace pelliko::contacts
{

struct TypeWord {
    const char *word;
    int bit;         ///< NumberType
    bool is_written; ///< false for words that are only read
};

inline constexpr std::array type_words{
    TypeWord{"HOME", number_home, true},   TypeWord{"WORK", number_work, true},
    TypeWord{"VOICE", number_voice, true}, TypeWord{"FAX", number_fax, true},
    TypeWord{"MSG", number_message, true}, TypeWord{"TEXT", number_message, false},
    TypeWord{"CELL", number_cell, true},   TypeWord{"PAGER", number_pager, true},
};

} // namespace pelliko::contacts
