// vCards of contacts that have nothing to escape
#pragma once

#include <optional>
#include <string>

#include "ContactCard.h"

namespace pelliko::contacts
{

/// The card as vCard 3.0, byte by byte as the vCard library writes it, in a tenth of the time. Null
/// when there is anything in it that takes more than copying: a letter to escape, a line to fold, a
/// picture, a label.
std::optional<std::string> plainVcardText(const ContactCard &card);

} // namespace pelliko::contacts
