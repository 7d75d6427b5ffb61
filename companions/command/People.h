// From what was typed to people of the contacts.
#pragma once

#include <ContactNames.h>

#include <string>
#include <vector>

namespace pelliko::command
{

/// Whom one --to means. Exactly one of the three is there.
struct Found {
    /// A number of the contacts, by its id; 0 when there is none.
    int32_t id = 0;
    /// A phone number, of somebody in the contacts or of nobody.
    std::string number;
    /// Why nobody is meant for certain; may have lines with candidates.
    std::string fault;
};

/// Finds a person by name: whole, or a part that is in one name only; case does not matter. A phone
/// number, however it is written, is taken as it is.
Found findPerson(const std::string &who, const std::vector<companion::ContactNumber> &contacts);

/// Those whose name or number has the text in it; all for an empty one.
std::vector<companion::ContactNumber>
peopleWith(const std::string &text, const std::vector<companion::ContactNumber> &contacts);

} // namespace pelliko::command
