// A ContactCard written as a vCard.
#pragma once

#include <string>

#include "ContactCard.h"

namespace pelliko::contacts
{

/// The card as vCard 3.0 in UTF-8, with CRLF at its end: all numbers with their types, the picture
/// inside. Throws std::runtime_error when the installation lacks the vCard library's module.
std::string vcardText(const ContactCard &card);

/// The same bytes, made by the vCard library in any case.
std::string vcardTextByLibrary(const ContactCard &card);

} // namespace pelliko::contacts
