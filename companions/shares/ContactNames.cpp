#include "ContactNames.h"

#include <contacts.h>
#include <glib.h>

#include <algorithm>
#include <functional>
#include <iterator>
#include <memory>

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

std::string folded(const std::string &text)
{
    g_autofree char *lower = g_utf8_casefold(text.c_str(), -1);
    return lower;
}

std::string digitsOf(const std::string &text)
{
    std::string digits;
    std::copy_if(text.begin(), text.end(), std::back_inserter(digits),
                 [](char c) { return g_ascii_isdigit(c) || c == '+'; });
    return digits;
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

std::vector<ContactNumber> contactNumbers()
{
    contacts_list_h list = nullptr;
    if (contacts_db_get_all_records(_contacts_person_number._uri, 0, 0, &list) !=
        CONTACTS_ERROR_NONE)
        return {};
    std::vector<ContactNumber> found;
    visit(list, [&found](contacts_record_h record) {
        ContactNumber number{numberOf(record, _contacts_person_number.number_id),
                             textOf(record, _contacts_person_number.display_name),
                             textOf(record, _contacts_person_number.number)};
        if (!number.name.empty() && !number.number.empty())
            found.push_back(std::move(number));
        return true;
    });
    std::sort(found.begin(), found.end(), [](const ContactNumber &a, const ContactNumber &b) {
        return a.name != b.name ? a.name < b.name : a.id < b.id;
    });
    return found;
}

bool matches(const ContactNumber &number, const std::string &typed)
{
    if (folded(number.name).find(folded(typed)) != std::string::npos)
        return true;
    const std::string digits = digitsOf(typed);
    return !digits.empty() && digitsOf(number.number).find(digits) != std::string::npos;
}

} // namespace pelliko::companion
