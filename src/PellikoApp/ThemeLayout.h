// Layouts from the application's theme file, and the record's fields that hold widgets. Main loop
// only.
#pragma once

#include <Evas.h>
#include <string>

typedef struct _Elm_Theme Elm_Theme;

namespace pelliko
{

/// The path of "edje/pelliko.edj" in the application's resources.
std::string themeFile();

/// A new layout of a group of "edje/pelliko.edj" in the application's resources. A missing group or
/// file is logged and leaves the layout empty.
Evas_Object *addThemeLayout(Evas_Object *parent, Elm_Theme *theme, const char *group);

/// Gives a layout another group of the theme file.
void setThemeGroup(Evas_Object *layout, const char *group);

/// Stores an object in a field that becomes null by itself when the object is deleted, whoever
/// deletes it: a deleted parent takes its children along. The field must outlive the object.
void keepWhileAlive(Evas_Object **field, Evas_Object *object);

} // namespace pelliko
