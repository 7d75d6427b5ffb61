#include "Contacts.h"

#include "People.h"

#include <contacts.h>

#include <nlohmann/json.hpp>

#include <algorithm>
#include <cstdio>

namespace pelliko::command
{
namespace
{

using companion::ContactNumber;

constexpr int indentation = 2;

void printJson(const std::vector<ContactNumber> &people)
{
    auto list = nlohmann::ordered_json::array();
    for (const ContactNumber &person : people)
        list.push_back(
            {{"number_id", person.id}, {"name", person.name}, {"number", person.number}});
    std::puts(list.dump(indentation, ' ', false, nlohmann::ordered_json::error_handler_t::replace)
                  .c_str());
}

void printTable(const std::vector<ContactNumber> &people)
{
    int widest = 0;
    for (const ContactNumber &person : people)
        widest = std::max(widest, columnsOf(printable(person.name)));
    for (const ContactNumber &person : people) {
        const std::string name = printable(person.name);
        const std::string number = printable(person.number);
        if (forPeople())
            std::printf("%s  %s\n", padded(name, widest).c_str(), number.c_str());
        else
            std::printf("%s\t%s\n", name.c_str(), number.c_str());
    }
}

} // namespace

Exit readContacts(std::vector<ContactNumber> &contacts)
{
    // Stays connected: the command ends soon.
    if (contacts_connect() != CONTACTS_ERROR_NONE)
        return refuse(Exit::failed, "the contacts cannot be read");
    contacts = companion::contactNumbers();
    return Exit::done;
}

Exit listContacts(const std::string &text, bool asJson)
{
    std::vector<ContactNumber> contacts;
    if (const Exit status = readContacts(contacts); status != Exit::done)
        return status;
    const std::vector<ContactNumber> people = peopleWith(text, contacts);
    if (asJson)
        printJson(people);
    else
        printTable(people);
    const Exit status = finish();
    if (status != Exit::done || !people.empty() || text.empty())
        return status;
    return refuse(Exit::recipient, "nobody in the contacts has “" + printable(text) + "”");
}

} // namespace pelliko::command
