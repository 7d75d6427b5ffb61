#include "SmsText.h"

#include <glib.h>

namespace pelliko::modem
{
namespace
{

constexpr size_t longestCharacter = 4;
constexpr auto incomplete = static_cast<gunichar>(-2);

} // namespace

std::string wholeCharacters(const std::string &text)
{
    const auto length = static_cast<gssize>(text.size());
    const gchar *end = nullptr;
    if (g_utf8_validate_len(text.c_str(), text.size(), &end))
        return text;
    const auto valid = static_cast<size_t>(end - text.c_str());
    const size_t rest = text.size() - valid;
    if (rest < longestCharacter &&
        g_utf8_get_char_validated(end, static_cast<gssize>(rest)) == incomplete)
        return text.substr(0, valid);
    g_autofree gchar *readable = g_utf8_make_valid(text.c_str(), length);
    return readable;
}

} // namespace pelliko::modem
