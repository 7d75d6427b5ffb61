// Who is behind a phone number.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace pelliko::companion
{

/// A number of the contacts store that something can be shared with.
struct ContactNumber {
    int32_t id = 0;
    std::string name;
    std::string number;
};

/// Opens the contacts store, once, before any name is asked for. Without it there are no names.
void useContacts();

/// The name of the first contact with this number that has a name; empty when there is none.
std::string nameOfNumber(const std::string &number);

/// The name of the contact that a number of the store belongs to; empty when there is none.
std::string nameOfNumberId(int32_t id);

/// All numbers of people with a name, in the order of the names.
std::vector<ContactNumber> contactNumbers();

/// Whether a typed text is in the name (case ignored) or, without its blanks, in the number.
bool matches(const ContactNumber &number, const std::string &typed);

} // namespace pelliko::companion
