// The card of the handset's own user.
#pragma once

#include <optional>

#include "ContactCard.h"
#include "ContactsWriter.h"

namespace pelliko::contacts
{

/// Keeps the card, in place of the one before it, as my-profile.vcf in the state directory: it is
/// no contact and no look-up finds it. On disk when it returns.
Outcome<bool> saveMyProfile(const ContactCard &card);

/// Null when there is none. Throws std::system_error when it cannot be read.
std::optional<ContactCard> readMyProfile();

} // namespace pelliko::contacts
