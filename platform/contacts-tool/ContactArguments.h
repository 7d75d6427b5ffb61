// Contacts out of command-line arguments.
#pragma once

#include <optional>
#include <string>

#include "ContactCard.h"

namespace pelliko::contacts_tool
{

/// A card with that name and, when a file is named, that picture. Null, with a sentence in `error`,
/// when the name is empty or has several lines, or the file is no picture.
std::optional<contacts::ContactCard> namedCard(const std::string &name,
                                               const std::string &picture_file, std::string &error);

/// Adds a mobile number, the first of a card as its default; false, with a sentence in `error`,
/// when the text is no number.
bool addNumber(contacts::ContactCard &card, const std::string &number, std::string &error);

} // namespace pelliko::contacts_tool
