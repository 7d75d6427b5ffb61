// A line of a list that is pressed as a whole.
#pragma once

#include <Elementary.h>

#include <string>

namespace pelliko::companion
{

/// What a row shows. Texts are in the user's language already.
struct RowTexts {
    std::string title;
    std::string second;
    /// A row with a third line keeps it, one without never gets one.
    std::string third;
};

bool operator==(const RowTexts &a, const RowTexts &b);

/// At the end of the box; pressed with the pointer, Return or Space.
/// @param icon name of a picture in the desktop's icon theme, or null for a row without
Evas_Object *addListRow(Evas_Object *box, const RowTexts &texts, const char *icon,
                        Evas_Smart_Cb pressed, void *data);

/// Gives a row other words; assistive programs get them as one.
void setRowTexts(Evas_Object *row, const RowTexts &texts);

} // namespace pelliko::companion
