#include "PellikoApp/TextFormat.h"

#include <clocale>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <libintl.h>
#include <locale.h>
#include <optional>
#include <string_view>

namespace pelliko
{

namespace
{

constexpr const char *textDomain = "pelliko";
constexpr size_t maxArguments = 9;

bool _isDigit(char c)
{
    return c >= '0' && c <= '9';
}

// One conversion of a format, read from just behind its "%".
struct Conversion {
    size_t position = 0; ///< argument it asks for, from 1; 0: the next one
    char kind = 0;       ///< as in formatTranslated
};

void _skipDigits(std::string_view &rest)
{
    while (!rest.empty() && _isDigit(rest.front()))
        rest.remove_prefix(1);
}

size_t _takePosition(std::string_view &rest)
{
    if (rest.size() < 2 || !_isDigit(rest[0]) || rest[1] != '$')
        return 0;
    const auto position = static_cast<size_t>(rest[0] - '0');
    rest.remove_prefix(2);
    return position;
}

char _kindOf(char conversion)
{
    switch (conversion) {
    case 'd':
    case 'i':
        return 'd';
    case 'f':
        return 'f';
    case 's':
        return 's';
    default:
        return 0;
    }
}

// Nothing when the conversion is one that no argument of ours can serve.
std::optional<Conversion> _takeConversion(std::string_view &rest)
{
    Conversion conversion;
    conversion.position = _takePosition(rest);
    while (!rest.empty() && strchr("-+ #0'", rest.front()) != nullptr)
        rest.remove_prefix(1);
    _skipDigits(rest);
    if (!rest.empty() && rest.front() == '.') {
        rest.remove_prefix(1);
        _skipDigits(rest);
    }
    if (rest.empty())
        return std::nullopt;
    conversion.kind = _kindOf(rest.front());
    rest.remove_prefix(1);
    if (conversion.kind == 0)
        return std::nullopt;
    return conversion;
}

// Whether printing `format` with arguments of these kinds is defined: every conversion finds an
// argument of its kind, and numbered conversions are not mixed with others and leave no gap.
bool _matches(std::string_view format, std::string_view kinds)
{
    bool asked[maxArguments + 1] = {};
    size_t highest = 0;
    size_t plain = 0;
    size_t numbered = 0;
    for (;;) {
        const size_t percent = format.find('%');
        if (percent == std::string_view::npos)
            break;
        format.remove_prefix(percent + 1);
        if (!format.empty() && format.front() == '%') {
            format.remove_prefix(1);
            continue;
        }
        const auto conversion = _takeConversion(format);
        if (!conversion)
            return false;
        ++(conversion->position != 0 ? numbered : plain);
        const size_t argument = conversion->position != 0 ? conversion->position : plain;
        if (argument > kinds.size() || argument > maxArguments ||
            kinds[argument - 1] != conversion->kind)
            return false;
        asked[argument] = true;
        highest = argument > highest ? argument : highest;
    }
    for (size_t i = 1; i <= highest; ++i) {
        if (!asked[i])
            return false;
    }
    return plain == 0 || numbered == 0;
}

size_t _characterLength(unsigned char lead)
{
    if (lead < 0x80)
        return 1;
    if (lead >= 0xc2 && lead < 0xe0)
        return 2;
    if (lead >= 0xe0 && lead < 0xf0)
        return 3;
    if (lead >= 0xf0 && lead < 0xf5)
        return 4;
    return 0;
}

locale_t _plainLocale()
{
    static const locale_t plain = newlocale(LC_ALL_MASK, "C", nullptr);
    return plain;
}

} // namespace

const char *translated(const char *id)
{
    return dgettext(textDomain, id);
}

void dropBrokenCharacter(char *text)
{
    const size_t length = strlen(text);
    size_t start = length;
    while (start > 0 && length - start < 4) {
        --start;
        const auto byte = static_cast<unsigned char>(text[start]);
        if ((byte & 0xc0) == 0x80)
            continue; // inside a character: its first byte is further left
        if (_characterLength(byte) > length - start)
            text[start] = '\0';
        return;
    }
}

void copyText(char *buffer, size_t size, const char *text)
{
    if (size == 0)
        return;
    const size_t length = text ? strnlen(text, size) : 0;
    const size_t kept = length < size ? length : size - 1;
    if (kept > 0)
        memcpy(buffer, text, kept);
    buffer[kept] = '\0';
    if (kept < length)
        dropBrokenCharacter(buffer);
}

void formatTranslated(char *buffer, size_t size, const char *format, const char *kinds, ...)
{
    if (size == 0)
        return;
    if (!_matches(format, kinds)) {
        copyText(buffer, size, format);
        return;
    }
    va_list arguments;
    va_start(arguments, kinds);
    const int length = vsnprintf(buffer, size, format, arguments);
    va_end(arguments);
    if (length < 0)
        copyText(buffer, size, format);
    else if (static_cast<size_t>(length) >= size)
        dropBrokenCharacter(buffer);
}

PlainNumbers::PlainNumbers() : previous_(nullptr)
{
    const locale_t plain = _plainLocale();
    if (plain != nullptr)
        previous_ = uselocale(plain);
}

PlainNumbers::~PlainNumbers()
{
    if (previous_ != nullptr)
        uselocale(static_cast<locale_t>(previous_));
}

} // namespace pelliko
