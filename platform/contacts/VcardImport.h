// A file of vCards into the contacts store.
#pragma once

#include <string>
#include <vector>

#include "ContactsWriter.h"

namespace pelliko::contacts
{

struct ImportReport {
    size_t added = 0;
    size_t updated = 0;
    size_t skipped = 0;
    std::vector<std::string> messages; ///< sentences that name the card's place, in its order
};

/// One card's text, and where it stands, for messages.
struct PlacedCard {
    std::string place; ///< such as "card 3 (line 20)"
    std::string text;  ///< whole, UTF-8
    std::string error; ///< why it is no card, or empty
};

/// Imports the cards that can be read in one transaction. Fails, leaving the store as it was, when
/// it cannot be written.
Outcome<ImportReport> importCards(ContactsWriter &writer, const std::vector<PlacedCard> &cards);

/// Imports every card that can be read in one transaction. Fails, leaving the store as it was, when
/// the file cannot be read, holds no card, or the store cannot be written. Skipped cards are no
/// failure.
Outcome<ImportReport> importVcards(ContactsWriter &writer, const std::string &path);

} // namespace pelliko::contacts
