// The row changes that saving a contact consists of. All run inside the caller's transaction and
// throw SQLite::Exception or std::runtime_error.
#pragma once

#include <optional>
#include <set>
#include <string>

#include "ContactCard.h"
#include "ContactsWriter.h"

namespace pelliko::contacts
{

/// Adds or updates the contact of the card. A picture's path is given, its file being in place;
/// empty keeps the one that the contact has. A picture that is replaced goes into `replaced`.
SavedContact saveCard(SQLite::Database &database, const ContactCard &card,
                      const std::string &picture_path, std::set<std::string> &replaced);

/// False when there is no such number.
bool setLetters(SQLite::Database &database, int number_id,
                const std::optional<std::string> &letters);

} // namespace pelliko::contacts
