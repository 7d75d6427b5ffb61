#include "Search.h"

#include <glib.h>

#include <algorithm>
#include <sstream>
#include <string_view>

namespace pelliko::companion
{
namespace
{

// What stands above or below a letter of Latin, Greek or Cyrillic, and the points of Hebrew and
// Arabic. Signs of Indic scripts, tones of Thai and the like make another letter and stay.
bool isAccent(gunichar letter)
{
    const int place = g_unichar_combining_class(letter);
    return place >= 200 || (place >= 10 && place <= 35);
}

// Letters with a stroke are not composed of anything, yet typed without it.
gunichar withoutStroke(gunichar letter)
{
    switch (letter) {
    case 0x00F8: // o
        return 'o';
    case 0x0142: // l
        return 'l';
    case 0x0111: // d
        return 'd';
    case 0x0131: // i without its dot
        return 'i';
    default:
        return letter;
    }
}

void append(std::string &text, gunichar letter)
{
    char bytes[6];
    text.append(bytes, static_cast<size_t>(g_unichar_to_utf8(letter, bytes)));
}

template <typename Use> void eachLetter(const char *text, Use use)
{
    for (const char *at = text; *at; at = g_utf8_next_char(at))
        use(g_utf8_get_char(at));
}

std::string international(const std::string &digits)
{
    return digits.starts_with("00") ? "+" + digits.substr(2) : digits;
}

// A number as it is dialled at home begins with a zero that is gone behind a country's code.
std::string_view withoutTrunk(std::string_view digits)
{
    return digits.starts_with('0') && !digits.starts_with("00") ? digits.substr(1) : digits;
}

} // namespace

std::string foldedText(const std::string &text)
{
    g_autofree char *valid = g_utf8_make_valid(text.c_str(), -1);
    g_autofree char *lower = g_utf8_casefold(valid, -1);
    g_autofree char *parts = g_utf8_normalize(lower, -1, G_NORMALIZE_ALL);
    std::string folded;
    eachLetter(parts, [&folded](gunichar letter) {
        if (!isAccent(letter))
            append(folded, withoutStroke(letter));
    });
    return folded;
}

std::string digitsOf(const std::string &text)
{
    g_autofree char *valid = g_utf8_make_valid(text.c_str(), -1);
    std::string digits;
    eachLetter(valid, [&digits](gunichar letter) {
        const int value = g_unichar_digit_value(letter);
        if (value >= 0)
            digits += static_cast<char>('0' + value);
        else if (letter == '+')
            digits += '+';
    });
    return digits;
}

Search::Search(const std::string &typed) : digits_(digitsOf(typed))
{
    std::istringstream words(foldedText(typed));
    for (std::string word; words >> word;)
        words_.push_back(word);
}

bool Search::isInNumber(const std::string &digits) const
{
    if (digits.find(digits_) != std::string::npos)
        return true;
    constexpr size_t enough = 3; // fewer digits without the zero would be in nearly every number
    const std::string typed = international(digits_);
    const std::string_view local = withoutTrunk(typed);
    if (local.size() >= enough && digits.find(local) != std::string::npos)
        return true;
    const std::string_view stored = withoutTrunk(digits);
    return typed.starts_with('+') && stored.size() < digits.size() && stored.size() > enough &&
           typed.ends_with(stored);
}

bool Search::finds(const std::string &name, const std::string &number) const
{
    return findsFolded(foldedText(name), digitsOf(number));
}

bool Search::findsFolded(const std::string &name, const std::string &digits) const
{
    const bool named = std::all_of(words_.begin(), words_.end(), [&](const std::string &word) {
        return name.find(word) != std::string::npos;
    });
    return named || (!digits_.empty() && isInNumber(digits));
}

} // namespace pelliko::companion
