// The texts of a companion in the user's language.
#pragma once

#include <string>

namespace pelliko::companion
{

/// Marks a text for the catalogue without translating it yet.
constexpr const char *mark(const char *text)
{
    return text;
}

/// Follows the platform's language, also later on. Once, before the first text.
/// @param catalogue the program's message catalogue; kept, not copied
/// @param changed called after the language changed; may be null
void useLanguage(const char *catalogue, void (*changed)(void *data) = nullptr,
                 void *data = nullptr);

/// The program's message catalogue. Borrowed.
const char *textDomain();

/// The translation of an English text, or the text itself. Borrowed.
const char *translated(const char *text);

/// The translation that fits the number, with the number in place of "%d".
std::string counted(const char *one, const char *many, unsigned long number);

/// The translation with `value` in place of "%s". The value is kept apart from the direction of the
/// text around it, as a name may run from right to left.
std::string filledIn(const char *text, const std::string &value);

} // namespace pelliko::companion
