// A line of a list that is pressed as a whole.
#pragma once

#include "RowTexts.h"

#include <Elementary.h>

namespace pelliko::companion
{

/// At the end of the box; pressed with the pointer, Return or Space.
/// @param icon name of a picture in the desktop's icon theme, or null for a row without
Evas_Object *addListRow(Evas_Object *box, const RowTexts &texts, const char *icon,
                        Evas_Smart_Cb pressed, void *data);

/// Gives a row other words; assistive programs get them as one.
void setRowTexts(Evas_Object *row, const RowTexts &texts);

} // namespace pelliko::companion
