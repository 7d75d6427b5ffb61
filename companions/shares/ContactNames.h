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
    /// File with a picture of the person; may be empty.
    std::string picture{};
    /// Bits as in the contacts store: what kind of number it is.
    int type = 0;
    /// Whoever has not joined is told by SMS.
    bool joined = false;
};

/// Opens the contacts store, once, before any name is asked for. Without it there are no names.
void useContacts();

/// The name of the first contact with this number that has a name; empty when there is none.
std::string nameOfNumber(const std::string &number);

/// The name of the contact that a number of the store belongs to; empty when there is none.
std::string nameOfNumberId(int32_t id);

/// All numbers of people with a name, in the order of the names.
/// @param readable gets false when the store cannot be read; may be null
std::vector<ContactNumber> contactNumbers(bool *readable = nullptr);

/// Whether a typed text is in the name or the number, see Search.
bool matches(const ContactNumber &number, const std::string &typed);

} // namespace pelliko::companion
