// Writing to the contacts store: for the command-line tool and for the service that keeps the
// joined users up to date. Applications only read (contacts.h).
#pragma once

#include <memory>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "ContactCard.h"

namespace SQLite
{
class Database;
}

namespace pelliko::contacts
{

/// A value, or a sentence that says why there is none.
template <typename T> struct Outcome {
    std::optional<T> value;
    std::string error;

    explicit operator bool() const { return value.has_value(); }
};

struct SavedContact {
    int contact_id;
    bool added;                  ///< false: the contact was there and is up to date now
    std::vector<int> number_ids; ///< of the card's numbers, in their order
};

struct ListedNumber {
    int number_id;
    int contact_id;
    std::string name;
    std::string number;
    bool joined;
};

/// One connection for writing; used by one thread at a time. Errors are values, nothing throws but
/// std::bad_alloc.
class ContactsWriter
{
public:
    static Outcome<ContactsWriter> open();
    ContactsWriter(ContactsWriter &&) noexcept;
    ContactsWriter &operator=(ContactsWriter &&) noexcept;
    ~ContactsWriter();

    /// Writes the cards in one transaction: on disk when it returns, or none of them. A card whose
    /// uid is known replaces that contact; one whose name and any number are known completes it. A
    /// number that stays keeps its id.
    [[nodiscard]] Outcome<std::vector<SavedContact>> save(std::span<const ContactCard> cards);

    /// Sets the sharing service's letters of a number ("R": joined; null: known but without
    /// letters), adding its row in the service's address book. The value is false when there is no
    /// such number.
    [[nodiscard]] Outcome<bool> setServiceLetters(int number_id,
                                                  const std::optional<std::string> &letters);

    /// All numbers with a contact, by number id.
    [[nodiscard]] Outcome<std::vector<ListedNumber>> numbers();

private:
    explicit ContactsWriter(std::unique_ptr<SQLite::Database> database);

    std::unique_ptr<SQLite::Database> m_database;
};

} // namespace pelliko::contacts
