#pragma once

#include <Evas.h>

namespace pelliko
{

/// What assistive programs call the object, instead of a text that they find in it.
void setAccessibleName(Evas_Object *object, const char *name);

} // namespace pelliko
