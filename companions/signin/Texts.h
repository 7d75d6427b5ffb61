// What went wrong with a sign-in, in words.
#pragma once

#include <string>

namespace pelliko::signin
{

/// What went wrong, as a sentence for the user, and what to do about it.
/// @param failure name of a failure, as kor_registration.h or SignIn give it
std::string failureText(const std::string &failure, long long retryAfterSeconds);

} // namespace pelliko::signin
