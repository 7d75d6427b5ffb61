#pragma once

#include "shares/Limits.h"
#include "store/Metadata.h"

#include <string_view>

namespace pelliko::server
{

/// Refuses files that no share may hold: none, too many, too large together.
void checkFiles(const std::vector<NewFile> &files, const Limits &limits);

/// Refuses a list of recipients that is empty, too long or holds what is no phone number.
void checkRecipients(const std::vector<Recipient> &recipients, const Limits &limits);

/// Refuses keys that are not 1 to 64 visible ASCII characters.
void checkIdempotencyKey(std::string_view key);

/// True for texts that a phone could dial: an optional plus, digits, the usual separators.
[[nodiscard]] bool isPhoneNumber(std::string_view number);

/// Turns anything but "created" and "known" into the refusal that it is.
void checkCreated(const CreateResult &result);

/// The share's record once it can be used; refuses one that has ended.
void checkLive(ShareState state);

} // namespace pelliko::server
