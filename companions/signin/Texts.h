// The texts of the sign-in in the user's language.
#pragma once

#include <string>

namespace pelliko::signin
{

/// Marks a text for the catalogue without translating it yet.
constexpr const char *mark(const char *text)
{
    return text;
}

inline constexpr const char *textDomain = "korrin";

/// Follows the platform's language, also later on. Once, before the first text.
void useLanguage();

/// The translation of an English text, or the text itself. Borrowed.
const char *translated(const char *text);

/// What went wrong, as a sentence for the user, and what to do about it.
/// @param failure name of a failure, as kor_registration.h or SignIn give it
std::string failureText(const std::string &failure, long long retryAfterSeconds);

} // namespace pelliko::signin
