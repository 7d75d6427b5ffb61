// The people that something can be shared with.
#pragma once

#include "Output.h"

#include <ContactNames.h>

#include <string>
#include <vector>

namespace pelliko::command
{

/// All numbers of people with a name, in the order of the names; complains when they cannot be
/// read.
Exit readContacts(std::vector<companion::ContactNumber> &contacts);

/// Lists those whose name or number has the text in it: aligned for people, with tabs for programs.
Exit listContacts(const std::string &text, bool asJson);

} // namespace pelliko::command
