#include "ContactNames.h"

#include "Search.h"

#include <contacts.h>
#include <contacts_ex.h>
#include <glib.h>

#include <algorithm>
#include <cstdlib>
#include <functional>
#include <map>
#include <memory>
#include <set>
#include <tuple>

namespace pelliko::companion
{
namespace
{

std::string textOf(contacts_record_h record, unsigned int property)
{
    char *text = nullptr;
    contacts_record_get_str_p(record, property, &text);
    return text ? text : "";
}

int numberOf(contacts_record_h record, unsigned int property)
{
    int number = 0;
    contacts_record_get_int(record, property, &number);
    return number;
}

// Until the visitor has seen enough.
void visit(contacts_list_h list, const std::function<bool(contacts_record_h)> &visitor)
{
    contacts_record_h record = nullptr;
    while (contacts_list_get_current_record_p(list, &record) == CONTACTS_ERROR_NONE && record) {
        if (!visitor(record) || contacts_list_next(list) != CONTACTS_ERROR_NONE)
            break;
    }
    contacts_list_destroy(list, true);
}

std::string firstName(unsigned int property, contacts_match_str_flag_e match,
                      const std::string &number)
{
    contacts_filter_h filter = nullptr;
    contacts_query_h query = nullptr;
    contacts_list_h list = nullptr;
    contacts_filter_create(_contacts_person_number._uri, &filter);
    contacts_filter_add_str(filter, property, match, number.c_str());
    contacts_query_create(_contacts_person_number._uri, &query);
    contacts_query_set_filter(query, filter);
    const int result = contacts_db_get_records_with_query(query, 0, 0, &list);
    contacts_query_destroy(query);
    contacts_filter_destroy(filter);
    std::string name;
    if (result == CONTACTS_ERROR_NONE)
        visit(list, [&name](contacts_record_h record) {
            name = textOf(record, _contacts_person_number.display_name);
            return name.empty();
        });
    return name;
}

struct RecordEnd {
    void operator()(contacts_record_h record) const { contacts_record_destroy(record, true); }
};
using Record = std::unique_ptr<std::remove_pointer_t<contacts_record_h>, RecordEnd>;

Record readRecord(const char *view, int id)
{
    contacts_record_h record = nullptr;
    if (contacts_db_get_record(view, id, &record) != CONTACTS_ERROR_NONE)
        return nullptr;
    return Record(record);
}

constexpr const char *serviceBook = "ZORP_Universal_Contact";

// The numbers of those who have joined: of each the first letters that are there decide.
std::set<int32_t> joinedNumbers()
{
    contacts_filter_h filter = nullptr;
    contacts_query_h query = nullptr;
    contacts_list_h list = nullptr;
    contacts_filter_create(_contacts_person_contact._uri, &filter);
    contacts_filter_add_str(filter, _contacts_person_contact.address_book_name,
                            CONTACTS_MATCH_FULLSTRING, serviceBook);
    contacts_query_create(_contacts_person_contact._uri, &query);
    contacts_query_set_filter(query, filter);
    const int result = contacts_db_get_records_with_query(query, 0, 0, &list);
    contacts_query_destroy(query);
    contacts_filter_destroy(filter);
    std::map<std::string, std::string> letters;
    if (result == CONTACTS_ERROR_NONE)
        visit(list, [&letters](contacts_record_h record) {
            const std::string of = textOf(record, _contacts_person_contact_ex.sync2);
            if (!of.empty())
                letters.emplace(textOf(record, _contacts_person_contact_ex.number_id), of);
            return true;
        });
    std::set<int32_t> joined;
    for (const auto &[id, of] : letters) {
        if (of.find('R') != std::string::npos)
            joined.insert(std::atoi(id.c_str()));
    }
    return joined;
}

ContactNumber numberIn(contacts_record_h record, const std::set<int32_t> &joined)
{
    const int id = numberOf(record, _contacts_person_number.number_id);
    return {id,
            textOf(record, _contacts_person_number.display_name),
            textOf(record, _contacts_person_number.number),
            textOf(record, _contacts_person_number.image_thumbnail_path),
            numberOf(record, _contacts_person_number.type),
            joined.count(id) > 0};
}

// By the letters of the names; what begins with none, like a number, comes last.
void sortByName(std::vector<ContactNumber> &numbers)
{
    std::vector<std::tuple<bool, std::string, size_t>> order;
    for (size_t i = 0; i < numbers.size(); ++i) {
        const gunichar first = g_utf8_get_char_validated(numbers[i].name.c_str(), -1);
        order.emplace_back(!g_unichar_isalpha(first), foldedText(numbers[i].name), i);
    }
    std::sort(order.begin(), order.end()); // the store's order decides between equal names
    std::vector<ContactNumber> sorted;
    sorted.reserve(numbers.size());
    for (const auto &[last, name, at] : order)
        sorted.push_back(std::move(numbers[at]));
    numbers = std::move(sorted);
}

} // namespace

void useContacts()
{
    contacts_connect();
}

std::string nameOfNumber(const std::string &number)
{
    if (number.empty())
        return {};
    std::string name =
        firstName(_contacts_person_number.number_filter, CONTACTS_MATCH_EXACTLY, number);
    if (name.empty())
        name = firstName(_contacts_person_number.number, CONTACTS_MATCH_CONTAINS, number);
    return name;
}

std::string nameOfNumberId(int32_t id)
{
    const Record number = readRecord(_contacts_number._uri, id);
    if (!number)
        return {};
    const int contactId = numberOf(number.get(), _contacts_number.contact_id);
    const Record contact = readRecord(_contacts_simple_contact._uri, contactId);
    return contact ? textOf(contact.get(), _contacts_simple_contact.display_name) : "";
}

std::vector<ContactNumber> contactNumbers(bool *readable)
{
    contacts_list_h list = nullptr;
    const int result = contacts_db_get_all_records(_contacts_person_number._uri, 0, 0, &list);
    if (readable)
        *readable = result == CONTACTS_ERROR_NONE;
    if (result != CONTACTS_ERROR_NONE)
        return {};
    const std::set<int32_t> joined = joinedNumbers();
    std::vector<ContactNumber> found;
    visit(list, [&](contacts_record_h record) {
        ContactNumber number = numberIn(record, joined);
        if (!number.name.empty() && !number.number.empty())
            found.push_back(std::move(number));
        return true;
    });
    sortByName(found);
    return found;
}

bool matches(const ContactNumber &number, const std::string &typed)
{
    return Search(typed).finds(number.name, number.number);
}

} // namespace pelliko::companion
