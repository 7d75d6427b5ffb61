// One vCard read into a ContactCard.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "ContactCard.h"

namespace pelliko::contacts
{

struct ReadCard {
    std::optional<ContactCard> card; ///< null when there is nothing in it to keep
    std::vector<std::string>
        notes; ///< half sentences for the user: what is missing or was left out
};

/// Reads a whole card (BEGIN to END, UTF-8) of version 2.1, 3.0 or 4.0. Pictures are taken from the
/// card or from a local file that it names; nothing is fetched from a network.
ReadCard readCard(const std::string &text);

} // namespace pelliko::contacts
