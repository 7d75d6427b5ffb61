// What assistive programs call a control.
#pragma once

#include <Evas.h>

namespace pelliko::companion
{

/// Replaces the text that they would find in the control.
void setAccessibleName(Evas_Object *object, const char *name);

/// Keeps from them what only repeats what its surroundings are called.
void hideFromReaders(Evas_Object *object);

} // namespace pelliko::companion
