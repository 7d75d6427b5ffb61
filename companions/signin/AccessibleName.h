// What assistive programs call a control.
#pragma once

#include <Evas.h>

namespace pelliko::signin
{

/// Replaces the text that they would find in the control.
void setAccessibleName(Evas_Object *object, const char *name);

} // namespace pelliko::signin
