// How the picker speaks.
#pragma once

#include "Content.h"

#include <ContactNames.h>

#include <string>

namespace pelliko::picker
{

/// What is shared, in one line: "3 files · plan.pdf, photo.jpg and 1 more".
std::string contentText(const Content &content);

/// What kind a number is, like "Work"; empty when that is not known.
std::string typeText(int type);

/// The line under a person's name.
/// @param several the person has other numbers too, so that their kinds tell them apart
std::string numberText(const companion::ContactNumber &person, bool several);

/// What assistive programs call a person's row: name, number and how the person is told.
std::string rowName(const companion::ContactNumber &person, bool several, bool chosen);

/// How many are chosen, and how many may be.
std::string chosenText(size_t count);

/// What stands in the place of a picture: one or two letters, or a sign for a name without any.
std::string initialsOf(const std::string &name);

} // namespace pelliko::picker
