#include "ListRow.h"

#include "AccessibleName.h"
#include "Icons.h"
#include "Theme.h"
#include "Widgets.h"

namespace pelliko::companion
{
namespace
{

constexpr int iconSize = 40;

// No widget of the toolkit: a control that holds one is told to assistive programs as one that the
// keyboard cannot act on.
void addIcon(Evas_Object *row, const char *name)
{
    const std::string file = iconFile(name);
    if (file.empty())
        return;
    Evas_Object *icon = evas_object_image_filled_add(evas_object_evas_get(row));
    evas_object_image_load_size_set(icon, scaled(iconSize), scaled(iconSize));
    evas_object_image_file_set(icon, file.c_str(), nullptr);
    elm_object_part_content_set(row, "icon", icon);
}

} // namespace

Evas_Object *addListRow(Evas_Object *box, const RowTexts &texts, const char *icon,
                        Evas_Smart_Cb pressed, void *data)
{
    Evas_Object *row = elm_button_add(box);
    elm_object_style_set(row, texts.third.empty() ? "companion/row" : "companion/row/three");
    if (icon)
        addIcon(row, icon);
    setRowTexts(row, texts);
    evas_object_smart_callback_add(row, "clicked", pressed, data);
    append(box, row);
    return row;
}

void setRowTexts(Evas_Object *row, const RowTexts &texts)
{
    elm_object_part_text_set(row, nullptr, texts.title.c_str());
    elm_object_part_text_set(row, "companion.second", texts.second.c_str());
    if (!texts.third.empty())
        elm_object_part_text_set(row, "companion.third", texts.third.c_str());
    std::string name = texts.title + ", " + texts.second;
    if (!texts.third.empty())
        name += ", " + texts.third;
    setAccessibleName(row, name.c_str());
}

} // namespace pelliko::companion
