#include "PellikoApp/ThemeLayout.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/CText.h"

#include <Elementary.h>
#include <app_common.h>
#include <string>

namespace pelliko
{

namespace
{

void _clearField(void *data, Evas *, Evas_Object *object, void *)
{
    auto **field = static_cast<Evas_Object **>(data);
    if (*field == object)
        *field = nullptr;
}

} // namespace

std::string themeFile()
{
    const CText resources(app_get_resource_path());
    return std::string(resources ? resources.get() : "") + "/edje/pelliko.edj";
}

Evas_Object *addThemeLayout(Evas_Object *parent, Elm_Theme *theme, const char *group)
{
    Evas_Object *layout = elm_layout_add(parent);
    elm_object_theme_set(layout, theme);
    setThemeGroup(layout, group);
    evas_object_size_hint_weight_set(layout, EVAS_HINT_EXPAND, EVAS_HINT_EXPAND);
    evas_object_size_hint_align_set(layout, EVAS_HINT_FILL, EVAS_HINT_FILL);
    return layout;
}

void setThemeGroup(Evas_Object *layout, const char *group)
{
    const std::string file = themeFile();
    if (!elm_layout_file_set(layout, file.c_str(), group))
        LOG_ERROR("elm_layout_file_set failed for %s", group);
}

void keepWhileAlive(Evas_Object **field, Evas_Object *object)
{
    *field = object;
    if (object)
        evas_object_event_callback_add(object, EVAS_CALLBACK_DEL, _clearField, field);
}

} // namespace pelliko
