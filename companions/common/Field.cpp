#include "Field.h"

#include "CText.h"
#include "Theme.h"
#include "Widgets.h"

namespace pelliko::companion
{
namespace
{

constexpr int lineHeight = 48;
// The toolkit's own style for what is typed is meant for a desktop.
constexpr double entryScale = 1.5;

// An entry works out its own least size, which is too low for a finger.
Evas_Object *withLeastHeight(Evas_Object *parent, Evas_Object *part)
{
    // No table: what is in one is not told to assistive programs.
    Evas_Object *row = elm_box_add(parent);
    elm_box_horizontal_set(row, EINA_TRUE);
    Evas_Object *height = evas_object_rectangle_add(evas_object_evas_get(parent));
    evas_object_size_hint_min_set(height, 0, scaled(lineHeight));
    elm_box_pack_end(row, height);
    evas_object_size_hint_weight_set(part, EVAS_HINT_EXPAND, EVAS_HINT_EXPAND);
    evas_object_size_hint_align_set(part, EVAS_HINT_FILL, EVAS_HINT_FILL);
    elm_box_pack_end(row, part);
    evas_object_show(part);
    return row;
}

// The toolkit takes any two presses that follow each other quickly for one double press, also when
// the second is into another entry, and gives that no focus.
void focusPressed(void *, Evas *, Evas_Object *entry, void *)
{
    if (!elm_object_focus_get(entry))
        elm_object_focus_set(entry, EINA_TRUE);
}

} // namespace

Field addField(Evas_Object *box, const char *name, const char *guide,
               Elm_Input_Panel_Layout keyboard)
{
    Field field;
    field.name = addText(box, "name", name);
    field.entry = elm_entry_add(box);
    elm_entry_single_line_set(field.entry, EINA_TRUE);
    elm_entry_scrollable_set(field.entry, EINA_TRUE);
    elm_entry_cnp_mode_set(field.entry, ELM_CNP_MODE_PLAINTEXT);
    elm_entry_autocapital_type_set(field.entry, ELM_AUTOCAPITAL_TYPE_NONE);
    elm_entry_prediction_allow_set(field.entry, EINA_FALSE);
    elm_entry_input_panel_layout_set(field.entry, keyboard);
    elm_object_part_text_set(field.entry, "elm.guide", guide);
    setTranslatedName(field.entry, name);
    elm_object_scale_set(field.entry, entryScale);
    evas_object_event_callback_add(field.entry, EVAS_CALLBACK_MOUSE_UP, focusPressed, nullptr);
    append(box, withLeastHeight(box, field.entry));
    return field;
}

std::string typedText(const Field &field)
{
    const CText text(elm_entry_markup_to_utf8(elm_entry_entry_get(field.entry)));
    return text ? text.get() : "";
}

void setTypedText(const Field &field, const std::string &text)
{
    const CText markup(elm_entry_utf8_to_markup(text.c_str()));
    elm_entry_entry_set(field.entry, markup ? markup.get() : "");
    elm_entry_cursor_end_set(field.entry);
}

} // namespace pelliko::companion
