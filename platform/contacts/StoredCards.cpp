#include "StoredCards.h"

#include <SQLiteCpp/SQLiteCpp.h>

#include "Database.h"
#include "PictureStore.h"

namespace pelliko::contacts
{

StoredCards::StoredCards(SQLite::Database &database)
    : m_contact(database, "SELECT display_name, display_source_type, uid, image_thumbnail_path "
                          "FROM contacts WHERE id = ? AND address_book_id = ?"),
      m_numbers(database, "SELECT number, type, label, is_default FROM numbers "
                          "WHERE contact_id = ? ORDER BY id")
{
    m_contact.bind(2, device_book);
}

std::optional<ContactCard> StoredCards::read(int contact_id)
{
    m_contact.reset();
    m_contact.bind(1, contact_id);
    if (!m_contact.executeStep())
        return std::nullopt;
    ContactCard card;
    card.display_name = m_contact.getColumn(0).getString();
    card.name_source = static_cast<NameSource>(m_contact.getColumn(1).getInt());
    card.uid = m_contact.getColumn(2).getString();
    const std::string picture = m_contact.getColumn(3).getString();
    m_contact.reset();
    std::string ignored;
    if (!picture.empty())
        card.picture = readPictureFile(picture, ignored).value_or(std::string());
    readNumbers(contact_id, card);
    return card;
}

void StoredCards::readNumbers(int contact_id, ContactCard &card)
{
    m_numbers.reset();
    m_numbers.bind(1, contact_id);
    while (m_numbers.executeStep()) {
        CardNumber &number = card.numbers.emplace_back();
        number.number = m_numbers.getColumn(0).getString();
        number.type = m_numbers.getColumn(1).getInt();
        number.label = m_numbers.getColumn(2).getString();
        number.is_default = m_numbers.getColumn(3).getInt() != 0;
    }
    m_numbers.reset();
}

} // namespace pelliko::contacts
