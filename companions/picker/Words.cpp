#include "Words.h"

#include "Choice.h"

#include <Language.h>

#include <glib.h>

#include <sstream>
#include <vector>

namespace pelliko::picker
{

using companion::ContactNumber;
using companion::counted;
using companion::filledIn;
using companion::translated;

namespace
{

constexpr const char *between = " \u00B7 ";

// Names keep their own direction within the line.
std::string isolated(const std::string &text)
{
    return "\u2068" + text + "\u2069";
}

// A number beside words that run from right to left keeps the order of its digits.
std::string leftToRight(const std::string &number)
{
    return "\u2066" + number + "\u2069";
}

// A line is no place for a text of any length. Its line breaks would be some, too.
std::string shortened(const std::string &text, glong most)
{
    g_autofree char *valid = g_utf8_make_valid(text.c_str(), -1);
    std::string line = g_strstrip(g_strdelimit(valid, "\r\n\t", ' '));
    if (g_utf8_strlen(line.c_str(), -1) > most) {
        g_autofree char *start = g_utf8_substring(line.c_str(), 0, most - 1);
        line = std::string(start) + "\u2026";
    }
    return line;
}

std::string namesText(const std::vector<std::string> &names)
{
    constexpr size_t mostNames = 3;
    constexpr glong longest = 40;
    std::string text;
    for (size_t i = 0; i < names.size() && i < mostNames; ++i)
        text += (i == 0 ? "" : ", ") + isolated(shortened(names[i], longest));
    if (names.size() > mostNames)
        text += " " + counted("and %d more", "and %d more", names.size() - mostNames);
    return text;
}

std::string filesText(const std::vector<std::string> &names)
{
    return names.size() == 1
               ? namesText(names)
               : counted("%d file", "%d files", names.size()) + between + namesText(names);
}

} // namespace

std::string contentText(const Content &content)
{
    constexpr glong longestText = 80;
    switch (content.kind) {
    case Content::Kind::files:
        return filesText(content.names);
    case Content::Kind::text:
        return translated("A text") + std::string(between) +
               isolated(shortened(content.text, longestText));
    case Content::Kind::contacts:
        return counted("%d contact", "%d contacts", content.count);
    case Content::Kind::again:
        return content.names.empty() ? translated("Files that you have shared before")
                                     : filesText(content.names);
    default:
        return {};
    }
}

std::string typeText(int type)
{
    // Bits of the contacts store.
    constexpr int home = 2;
    constexpr int work = 4;
    constexpr int cell = 64;
    if (type & cell)
        return translated("Mobile");
    if (type & work)
        return translated("Work");
    return type & home ? translated("Home") : "";
}

std::string numberText(const ContactNumber &person, bool several)
{
    if (person.id == 0)
        return translated("Not in your contacts");
    const std::string type = several ? typeText(person.type) : "";
    return type.empty() ? person.number : leftToRight(person.number) + between + type;
}

std::string rowName(const ContactNumber &person, bool several, bool chosen)
{
    const std::string name = person.id == 0 ? filledIn("Send to %s", person.number) : person.name;
    const std::string row = name + ", " + numberText(person, several) + ", " +
                            (person.joined ? translated("Sees it in Pelliko")
                                           : translated("Gets an SMS with the link"));
    return chosen ? filledIn("Chosen: %s", row) : row;
}

std::string chosenText(size_t count)
{
    return counted("%d person is chosen.", "%d people are chosen.", count) + " " +
           counted("At most one person.", "At most %d people at once.", Choice::most);
}

std::string initialsOf(const std::string &name)
{
    g_autofree char *valid = g_utf8_make_valid(name.c_str(), -1);
    std::istringstream words{std::string(valid)};
    std::vector<std::string> letters;
    for (std::string word; words >> word;) {
        const char *end = g_utf8_next_char(word.c_str());
        if (!g_unichar_isalpha(g_utf8_get_char(word.c_str())))
            continue;
        while (*end && g_unichar_ismark(g_utf8_get_char(end)))
            end = g_utf8_next_char(end); // a letter is nothing without its marks
        letters.emplace_back(word.c_str(), end);
    }
    if (letters.empty())
        return "+";
    // Scripts without large letters write one, as two would join to a word.
    const gunichar first = g_utf8_get_char(letters.front().c_str());
    const bool two = letters.size() > 1 && (g_unichar_isupper(first) || g_unichar_islower(first));
    const std::string both = letters.front() + (two ? letters.back() : "");
    g_autofree char *large = g_utf8_strup(both.c_str(), -1);
    return large;
}

} // namespace pelliko::picker
