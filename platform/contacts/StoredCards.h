// Contacts of the store read back as cards.
#pragma once

#include <optional>

#include <SQLiteCpp/Statement.h>

#include "ContactCard.h"

namespace pelliko::contacts
{

/// Reads contacts of the device's own book on one connection, which it borrows. Throws
/// SQLite::Exception.
class StoredCards
{
public:
    explicit StoredCards(SQLite::Database &database);

    /// The contact with all its numbers in their order; null when there is none of that id. A
    /// picture whose file is gone is left out.
    [[nodiscard]] std::optional<ContactCard> read(int contact_id);

private:
    void readNumbers(int contact_id, ContactCard &card);

    SQLite::Statement m_contact;
    SQLite::Statement m_numbers;
};

} // namespace pelliko::contacts
