#include "People.h"

#include "Output.h"

#include <glib.h>

#include <algorithm>
#include <functional>
#include <iterator>

namespace pelliko::command
{
namespace
{

using companion::ContactNumber;
using Contacts = std::vector<ContactNumber>;

// Fewer digits are no number that anybody has.
constexpr std::ptrdiff_t fewestDigits = 3;
constexpr std::size_t mostCandidates = 12;

// For comparing: case and the ways to compose a letter do not matter.
std::string folded(const std::string &text)
{
    g_autofree char *valid = g_utf8_make_valid(text.c_str(), -1);
    g_autofree char *composed = g_utf8_normalize(valid, -1, G_NORMALIZE_ALL);
    g_autofree char *lower = g_utf8_casefold(composed, -1);
    return g_strstrip(lower);
}

bool isDigit(char c)
{
    return g_ascii_isdigit(c) != FALSE;
}

std::string digitsOf(const std::string &number)
{
    std::string digits;
    std::copy_if(number.begin(), number.end(), std::back_inserter(digits),
                 [](char c) { return isDigit(c) || c == '+'; });
    return digits;
}

bool isNumber(const std::string &text)
{
    const bool written = std::all_of(text.begin(), text.end(), [](char c) {
        return isDigit(c) || std::string(" ()/.-+").find(c) != std::string::npos;
    });
    return written && text.find('+', 1) == std::string::npos &&
           std::count_if(text.begin(), text.end(), isDigit) >= fewestDigits;
}

Contacts those(const Contacts &contacts, const std::function<bool(const ContactNumber &)> &wanted)
{
    Contacts found;
    std::copy_if(contacts.begin(), contacts.end(), std::back_inserter(found), wanted);
    return found;
}

bool areOneNumber(const Contacts &found)
{
    return std::all_of(found.begin(), found.end(), [&found](const ContactNumber &contact) {
        return digitsOf(contact.number) == digitsOf(found.front().number);
    });
}

std::string severalPeople(const std::string &who, const Contacts &found)
{
    std::string fault = "“" + printable(who) + "” can be any of these; name one by the number:";
    for (std::size_t i = 0; i < found.size() && i < mostCandidates; ++i)
        fault += "\n  " + printable(found[i].name) + "  " + printable(found[i].number);
    if (found.size() > mostCandidates)
        fault += "\n  and " + std::to_string(found.size() - mostCandidates) + " more";
    return fault;
}

Found oneOf(const std::string &who, const Contacts &found)
{
    if (areOneNumber(found))
        return {found.front().id, {}, {}};
    return {0, {}, severalPeople(who, found)};
}

Found byName(const std::string &who, const Contacts &contacts)
{
    const std::string wanted = folded(who);
    if (wanted.empty())
        return {0, {}, "a recipient has no name"};
    const Contacts whole = those(contacts, [&wanted](const ContactNumber &contact) {
        return folded(contact.name) == wanted;
    });
    if (!whole.empty())
        return oneOf(who, whole);
    const Contacts part = those(contacts, [&wanted](const ContactNumber &contact) {
        return folded(contact.name).find(wanted) != std::string::npos;
    });
    if (!part.empty())
        return oneOf(who, part);
    return {0,
            {},
            "nobody in the contacts is called “" + printable(who) +
                "”; “pelliko contacts” shows who is there"};
}

} // namespace

Found findPerson(const std::string &who, const Contacts &contacts)
{
    return isNumber(who) ? Found{0, who, {}} : byName(who, contacts);
}

Contacts peopleWith(const std::string &text, const Contacts &contacts)
{
    return those(contacts, [&text](const ContactNumber &contact) {
        return text.empty() || companion::matches(contact, text);
    });
}

} // namespace pelliko::command
