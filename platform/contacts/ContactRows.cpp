#include "ContactRows.h"

#include <algorithm>

#include <SQLiteCpp/SQLiteCpp.h>

#include "Database.h"
#include "NumberText.h"

namespace pelliko::contacts
{
namespace
{

void bindText(SQLite::Statement &statement, int at, const std::string &text)
{
    if (text.empty())
        statement.bind(at);
    else
        statement.bind(at, text);
}

int lastId(SQLite::Database &database)
{
    return static_cast<int>(database.getLastInsertRowid());
}

std::optional<int> firstInt(SQLite::Statement &select)
{
    return select.executeStep() ? std::optional(select.getColumn(0).getInt()) : std::nullopt;
}

std::optional<int> contactOfUid(SQLite::Database &database, const std::string &uid)
{
    if (uid.empty())
        return std::nullopt;
    SQLite::Statement select(
        database, "SELECT id FROM contacts WHERE uid = ? AND address_book_id = ? ORDER BY id");
    select.bind(1, uid);
    select.bind(2, device_book);
    return firstInt(select);
}

std::optional<int> contactOfNameAndNumber(SQLite::Database &database, const ContactCard &card)
{
    SQLite::Statement select(
        database, "SELECT c.id FROM contacts c JOIN numbers n ON n.contact_id = c.id "
                  "WHERE c.display_name = ? AND c.address_book_id = ? AND n.normalized = ? "
                  "ORDER BY c.id");
    for (const CardNumber &number : card.numbers) {
        select.reset();
        select.bind(1, card.display_name);
        select.bind(2, device_book);
        bindText(select, 3, normalizeNumber(number.number));
        if (const auto found = firstInt(select))
            return found;
    }
    return std::nullopt;
}

std::optional<int> numberlessContactOfName(SQLite::Database &database, const std::string &name)
{
    SQLite::Statement select(database,
                             "SELECT c.id FROM contacts c WHERE c.display_name = ? "
                             "AND c.address_book_id = ? AND NOT EXISTS "
                             "(SELECT 1 FROM numbers n WHERE n.contact_id = c.id) ORDER BY c.id");
    select.bind(1, name);
    select.bind(2, device_book);
    return firstInt(select);
}

int addContact(SQLite::Database &database)
{
    database.exec("INSERT INTO persons DEFAULT VALUES");
    const int person_id = lastId(database);
    SQLite::Statement insert(database,
                             "INSERT INTO contacts (person_id, address_book_id) VALUES (?, ?)");
    insert.bind(1, person_id);
    insert.bind(2, device_book);
    insert.exec();
    const int contact_id = lastId(database);
    SQLite::Statement show(database, "UPDATE persons SET display_contact_id = ? WHERE id = ?");
    show.bind(1, contact_id);
    show.bind(2, person_id);
    show.exec();
    return contact_id;
}

void updateContact(SQLite::Database &database, int contact_id, const ContactCard &card,
                   const std::string &picture_path)
{
    SQLite::Statement update(database, "UPDATE contacts SET display_name = ?2, "
                                       "display_source_type = ?3, uid = coalesce(?4, uid), "
                                       "image_thumbnail_path = coalesce(?5, image_thumbnail_path) "
                                       "WHERE id = ?1");
    update.bind(1, contact_id);
    bindText(update, 2, card.display_name);
    update.bind(3, static_cast<int>(card.name_source));
    bindText(update, 4, card.uid);
    bindText(update, 5, picture_path);
    update.exec();
    SQLite::Statement follow(database,
                             "UPDATE contacts SET display_name = ?2 WHERE address_book_id = ?3 "
                             "AND person_id = (SELECT person_id FROM contacts WHERE id = ?1)");
    follow.bind(1, contact_id);
    bindText(follow, 2, card.display_name);
    follow.bind(3, service_book);
    follow.exec();
}

std::string pictureOf(SQLite::Database &database, int contact_id)
{
    SQLite::Statement select(database, "SELECT image_thumbnail_path FROM contacts WHERE id = ?");
    select.bind(1, contact_id);
    return select.executeStep() ? select.getColumn(0).getString() : std::string();
}

// A number without any digit is only equal to itself.
std::optional<int> numberOf(SQLite::Database &database, int contact_id, const std::string &number)
{
    SQLite::Statement select(
        database, "SELECT id FROM numbers WHERE contact_id = ?1 AND "
                  "(normalized = ?2 OR (normalized IS NULL AND number = ?3)) ORDER BY id");
    select.bind(1, contact_id);
    bindText(select, 2, normalizeNumber(number));
    select.bind(3, number);
    return firstInt(select);
}

int addNumber(SQLite::Database &database, int contact_id)
{
    SQLite::Statement insert(database,
                             "INSERT INTO numbers (contact_id, number, folded) VALUES (?, '', '')");
    insert.bind(1, contact_id);
    insert.exec();
    return lastId(database);
}

int saveNumber(SQLite::Database &database, int contact_id, const CardNumber &number)
{
    const std::optional<int> known = numberOf(database, contact_id, number.number);
    const int number_id = known ? *known : addNumber(database, contact_id);
    SQLite::Statement update(
        database, "UPDATE numbers SET type = ?2, label = ?3, is_default = ?4, "
                  "number = ?5, folded = ?6, cleaned = ?7, normalized = ?8 WHERE id = ?1");
    update.bind(1, number_id);
    update.bind(2, number.type);
    bindText(update, 3, number.label);
    update.bind(4, number.is_default ? 1 : 0);
    update.bind(5, number.number);
    update.bind(6, foldText(number.number));
    bindText(update, 7, cleanNumber(number.number));
    bindText(update, 8, normalizeNumber(number.number));
    update.exec();
    return number_id;
}

// Numbers that only an earlier card had stay; one of them may have been preferred then.
void preferNone(SQLite::Database &database, int contact_id)
{
    SQLite::Statement update(database, "UPDATE numbers SET is_default = 0 WHERE contact_id = ?");
    update.bind(1, contact_id);
    update.exec();
}

void removeNumber(SQLite::Database &database, int number_id)
{
    SQLite::Statement unmark(
        database, "DELETE FROM contacts WHERE lower(number_id) = ? AND address_book_id = ?");
    unmark.bind(1, std::to_string(number_id));
    unmark.bind(2, service_book);
    unmark.exec();
    SQLite::Statement remove(database, "DELETE FROM numbers WHERE id = ?");
    remove.bind(1, number_id);
    remove.exec();
}

void removeNumbersBut(SQLite::Database &database, int contact_id, const std::vector<int> &kept)
{
    std::vector<int> gone;
    SQLite::Statement select(database, "SELECT id FROM numbers WHERE contact_id = ?");
    select.bind(1, contact_id);
    while (select.executeStep()) {
        const int id = select.getColumn(0).getInt();
        if (std::find(kept.begin(), kept.end(), id) == kept.end())
            gone.push_back(id);
    }
    for (const int id : gone)
        removeNumber(database, id);
}

} // namespace

SavedContact saveCard(SQLite::Database &database, const ContactCard &card,
                      const std::string &picture_path, std::set<std::string> &replaced)
{
    const std::optional<int> same_uid = contactOfUid(database, card.uid);
    std::optional<int> known = same_uid;
    if (!known)
        known = card.numbers.empty() ? numberlessContactOfName(database, card.display_name)
                                     : contactOfNameAndNumber(database, card);
    const int contact_id = known ? *known : addContact(database);
    if (!picture_path.empty())
        replaced.insert(pictureOf(database, contact_id));
    updateContact(database, contact_id, card, picture_path);

    SavedContact saved{contact_id, !known, {}};
    if (std::any_of(card.numbers.begin(), card.numbers.end(),
                    [](const CardNumber &number) { return number.is_default; }))
        preferNone(database, contact_id);
    for (const CardNumber &number : card.numbers) {
        saved.number_ids.push_back(saveNumber(database, contact_id, number));
        if (number.joined)
            setLetters(database, saved.number_ids.back(), "R");
    }
    if (same_uid)
        removeNumbersBut(database, contact_id, saved.number_ids);
    return saved;
}

bool setLetters(SQLite::Database &database, int number_id,
                const std::optional<std::string> &letters)
{
    SQLite::Statement update(
        database,
        "UPDATE contacts SET sync2 = ? WHERE lower(number_id) = ? AND address_book_id = ?");
    SQLite::Statement insert(
        database, "INSERT INTO contacts (sync2, number_id, address_book_id, person_id, "
                  "display_name, display_source_type) "
                  "SELECT ?, ?, ?, c.person_id, c.display_name, c.display_source_type "
                  "FROM numbers n JOIN contacts c ON c.id = n.contact_id WHERE n.id = ?");
    for (SQLite::Statement *statement : {&update, &insert}) {
        if (letters)
            statement->bind(1, *letters);
        statement->bind(2, std::to_string(number_id));
        statement->bind(3, service_book);
    }
    insert.bind(4, number_id);
    return update.exec() > 0 || insert.exec() > 0;
}

} // namespace pelliko::contacts
