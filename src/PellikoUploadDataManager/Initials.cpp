#include "PellikoUploadDataManager/Initials.h"

#include <cstdint>
#include <glib.h>

namespace pelliko
{

namespace
{

constexpr uint32_t grounds = 5;

bool _isVowelBeforeItsLetter(gunichar letter)
{
    return (letter >= 0x0e40 && letter <= 0x0e44) || (letter >= 0x0ec0 && letter <= 0x0ec4);
}

// The letter at the beginning, with the marks that are written on it; empty without a letter.
std::string _letterAt(const char *text)
{
    gunichar letter = g_utf8_get_char(text);
    if (!g_unichar_isalpha(letter))
        return {};
    const char *end = g_utf8_next_char(text);
    if (_isVowelBeforeItsLetter(letter) && *end)
        end = g_utf8_next_char(end);
    while (*end && g_unichar_ismark(g_utf8_get_char(end)))
        end = g_utf8_next_char(end);
    char *upper = g_utf8_strup(text, end - text);
    std::string result = upper;
    g_free(upper);
    return result;
}

const char *_skipSpaces(const char *text)
{
    while (*text && g_unichar_isspace(g_utf8_get_char(text)))
        text = g_utf8_next_char(text);
    return text;
}

// Where the last word begins.
const char *_lastWord(const char *text)
{
    const char *last = text;
    for (const char *at = text; *at; at = g_utf8_next_char(at)) {
        const char *next = g_utf8_next_char(at);
        if (g_unichar_isspace(g_utf8_get_char(at)) && *next &&
            !g_unichar_isspace(g_utf8_get_char(next)))
            last = next;
    }
    return last;
}

// Arabic or Chinese names are not known by two letters.
bool _hasCapitals(gunichar letter)
{
    return g_unichar_toupper(letter) != letter || g_unichar_tolower(letter) != letter;
}

} // namespace

std::string initialsOf(const char *name)
{
    if (!name || !g_utf8_validate(name, -1, nullptr))
        return {};
    const char *first = _skipSpaces(name);
    const std::string letter = _letterAt(first);
    const char *last = _lastWord(first);
    const bool two = !letter.empty() && last != first && _hasCapitals(g_utf8_get_char(first)) &&
                     _hasCapitals(g_utf8_get_char(last));
    return two ? letter + _letterAt(last) : letter;
}

int initialsGround(const char *name)
{
    uint32_t sum = 2166136261U; // FNV-1a
    for (const char *at = name ? name : ""; *at; ++at)
        sum = (sum ^ static_cast<unsigned char>(*at)) * 16777619U;
    return static_cast<int>(sum % grounds) + 1;
}

} // namespace pelliko
