#include "NumberText.h"

#include <algorithm>
#include <memory>

#include <glib.h>

namespace pelliko::contacts
{
namespace
{

struct GFree {
    void operator()(char *text) const { g_free(text); }
};
using GText = std::unique_ptr<char, GFree>;

bool isAscii(std::string_view text)
{
    return std::all_of(text.begin(), text.end(),
                       [](char c) { return static_cast<unsigned char>(c) < 0x80; });
}

GText validUtf8(std::string_view text)
{
    return GText(
        g_utf8_make_valid(text.data() ? text.data() : "", static_cast<gssize>(text.size())));
}

} // namespace

std::string foldText(std::string_view text)
{
    if (isAscii(text)) {
        std::string folded(text);
        std::transform(folded.begin(), folded.end(), folded.begin(), [](char c) {
            return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
        });
        return folded;
    }
    const GText valid = validUtf8(text);
    const GText folded(g_utf8_casefold(valid.get(), -1));
    const GText composed(g_utf8_normalize(folded.get(), -1, G_NORMALIZE_DEFAULT_COMPOSE));
    return composed ? composed.get() : folded.get();
}

std::string cleanNumber(std::string_view number)
{
    const GText valid = validUtf8(number);
    std::string cleaned;
    for (const char *at = valid.get(); *at; at = g_utf8_next_char(at)) {
        const gunichar letter = g_utf8_get_char(at);
        const int digit = g_unichar_digit_value(letter);
        if (digit >= 0)
            cleaned += static_cast<char>('0' + digit);
        else if (letter == '*' || letter == '#' || (letter == '+' && cleaned.empty()))
            cleaned += static_cast<char>(letter);
    }
    return cleaned == "+" ? std::string() : cleaned;
}

std::string normalizeNumber(std::string_view number)
{
    std::string cleaned = cleanNumber(number);
    if (cleaned.size() > 2 && cleaned.compare(0, 2, "00") == 0)
        cleaned.replace(0, 2, "+");
    return cleaned;
}

} // namespace pelliko::contacts
