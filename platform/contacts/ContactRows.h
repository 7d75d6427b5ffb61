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

/// Id, contact id, name, number and joined mark of every number; bound to the service's book.
/// Joined as an application tests it: the first row of that book with letters decides. Both sides
/// stand in lower() and the order behind a "+" so that the index over number ids is used.
inline constexpr const char *select_listed_numbers =
    "SELECT n.id, n.contact_id, coalesce(c.display_name, ''), n.number, "
    "coalesce((SELECT instr(s.sync2, 'R') > 0 FROM contacts s "
    "WHERE lower(s.number_id) = lower(n.id) AND s.address_book_id = ? "
    "AND s.sync2 IS NOT NULL ORDER BY +s.id LIMIT 1), 0) "
    "FROM numbers n JOIN contacts c ON c.id = n.contact_id ORDER BY n.id";

/// Adds or updates the contact of the card. A picture's path is given, its file being in place;
/// empty keeps the one that the contact has. A picture that is replaced goes into `replaced`.
SavedContact saveCard(SQLite::Database &database, const ContactCard &card,
                      const std::string &picture_path, std::set<std::string> &replaced);

/// False when there is no such number.
bool setLetters(SQLite::Database &database, int number_id,
                const std::optional<std::string> &letters);

} // namespace pelliko::contacts
