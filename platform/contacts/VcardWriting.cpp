#include "VcardWriting.h"

#include <optional>
#include <utility>

#include "PlainVcard.h"
#include "VcardModule.h"

namespace pelliko::contacts
{

std::string vcardText(const ContactCard &card)
{
    // The library takes as long for a card as the store, and nearly all cards are plain.
    std::optional<std::string> plain = plainVcardText(card);
    return plain ? std::move(*plain) : vcardTextByLibrary(card);
}

std::string vcardTextByLibrary(const ContactCard &card)
{
    return vcardModule().write(card);
}

} // namespace pelliko::contacts
