#include "contacts_new_number.h"

#include <set>
#include <string>

#include <SQLiteCpp/SQLiteCpp.h>

#include "ContactRows.h"
#include "Database.h"
#include "NumberText.h"
#include "contacts.h"

namespace pelliko::contacts
{
namespace
{

int firstOf(SQLite::Database &database, const std::string &normalized)
{
    SQLite::Statement select(
        database, "SELECT min(n.id) FROM numbers n JOIN contacts c ON c.id = n.contact_id "
                  "WHERE n.normalized = ? AND c.display_name IS NOT NULL");
    select.bind(1, normalized);
    return select.executeStep() ? select.getColumn(0).getInt() : 0;
}

int added(SQLite::Database &database, const std::string &number)
{
    ContactCard card;
    card.display_name = number;
    card.name_source = NameSource::Number;
    card.numbers.push_back({.number = number, .label = {}});
    std::set<std::string> pictures;
    return saveCard(database, card, {}, pictures).number_ids.front();
}

// Looking and adding are one transaction, so that two programs do not add the same number.
int findOrAdd(const std::string &number)
{
    const auto database = openDatabase(Access::Write);
    SQLite::Transaction transaction(*database, SQLite::TransactionBehavior::IMMEDIATE);
    const int found = firstOf(*database, normalizeNumber(number));
    const int id = found != 0 ? found : added(*database, number);
    transaction.commit();
    return id;
}

} // namespace
} // namespace pelliko::contacts

int contacts_find_or_add_number(const char *number, int *number_id)
{
    using namespace pelliko::contacts;
    if (!number || !number_id)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    try {
        if (normalizeNumber(number).find_first_of("0123456789") == std::string::npos)
            return CONTACTS_ERROR_INVALID_PARAMETER;
        *number_id = findOrAdd(number);
        return CONTACTS_ERROR_NONE;
    } catch (...) {
        return errorOfException();
    }
}
