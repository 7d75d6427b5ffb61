// The round picture of a person.
#pragma once

#include <ContactNames.h>

#include <Elementary.h>

namespace pelliko::picker
{

/// The person's picture, or the initials where it is missing or cannot be read, with a badge for
/// whoever is told by SMS. Assistive programs pass over it.
Evas_Object *addAvatar(Evas_Object *parent, const companion::ContactNumber &person);

} // namespace pelliko::picker
