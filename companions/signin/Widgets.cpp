#include "Widgets.h"

#include "AccessibleName.h"
#include "Texts.h"

#include <app_common.h>
#include <dlog.h>
#include <uxt_button.h>
#include <uxt_theme.h>

#include <cstdlib>
#include <memory>
#include <unistd.h>

namespace pelliko::signin
{
namespace
{

constexpr const char *logTag = "KORRIN";
constexpr int grid = 8;
constexpr int windowWidth = 480;
constexpr int windowHeight = 800;
constexpr int columnWidth = 440;
constexpr int lineHeight = 48;
// The toolkit's own style for what is typed is meant for a desktop.
constexpr double entryScale = 1.5;

using CText = std::unique_ptr<char, decltype(&free)>;

int scaled(int pixels)
{
    return ELM_SCALE_SIZE(pixels);
}

void append(Evas_Object *box, Evas_Object *part)
{
    evas_object_size_hint_weight_set(part, EVAS_HINT_EXPAND, 0.0);
    evas_object_size_hint_align_set(part, EVAS_HINT_FILL, 0.5);
    elm_box_pack_end(box, part);
    evas_object_show(part);
}

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

void extendTheme(const std::string &file)
{
    if (access(file.c_str(), R_OK) != 0)
        dlog_print(DLOG_ERROR, logTag, "no theme: %s", file.c_str());
    elm_theme_extension_add(nullptr, file.c_str());
}

Evas_Object *addGround(Evas_Object *window)
{
    int r = 255;
    int g = 255;
    int b = 255;
    uxt_theme_get_color("pelliko/card", &r, &g, &b, nullptr);
    Evas_Object *ground = evas_object_rectangle_add(evas_object_evas_get(window));
    evas_object_color_set(ground, r, g, b, 255);
    evas_object_size_hint_weight_set(ground, EVAS_HINT_EXPAND, EVAS_HINT_EXPAND);
    elm_win_resize_object_add(window, ground);
    evas_object_show(ground);
    return ground;
}

} // namespace

void useTheme()
{
    const CText resources(app_get_resource_path(), free);
    const CText shared(app_get_shared_resource_path(), free);
    if (!resources || !shared)
        return;
    extendTheme(std::string(resources.get()) + "edje/pelliko.edj");
    extendTheme(std::string(resources.get()) + "edje/signin.edj");
    const std::string tables = std::string(shared.get()) + "tables/com.velmora.pelliko_";
    uxt_theme_set_changeable_ui_enabled(EINA_TRUE);
    uxt_theme_set_color_table(
        uxt_theme_add_color_table((tables + "ChangeableColorTable.xml").c_str()));
    uxt_theme_set_font_table(uxt_theme_add_font_table((tables + "FontInfoTable.xml").c_str()));
}

Evas_Object *addText(Evas_Object *box, const char *style, const char *text)
{
    Evas_Object *label = elm_label_add(box);
    elm_object_style_set(label, (std::string("signin/") + style).c_str());
    elm_label_line_wrap_set(label, ELM_WRAP_MIXED);
    elm_object_domain_translatable_part_text_set(label, nullptr, textDomain, text);
    append(box, label);
    return label;
}

void setText(Evas_Object *label, const std::string &words)
{
    const CText markup(elm_entry_utf8_to_markup(words.c_str()), free);
    elm_object_domain_translatable_part_text_set(label, nullptr, textDomain, nullptr);
    elm_object_text_set(label, markup ? markup.get() : "");
    setAccessibleName(label, words.c_str());
}

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
    setAccessibleName(field.entry, translated(name));
    elm_object_scale_set(field.entry, entryScale);
    append(box, withLeastHeight(box, field.entry));
    return field;
}

std::string typedText(const Field &field)
{
    const CText text(elm_entry_markup_to_utf8(elm_entry_entry_get(field.entry)), free);
    return text ? text.get() : "";
}

void setTypedText(const Field &field, const std::string &text)
{
    const CText markup(elm_entry_utf8_to_markup(text.c_str()), free);
    elm_entry_entry_set(field.entry, markup ? markup.get() : "");
    elm_entry_cursor_end_set(field.entry);
}

Evas_Object *addButton(Evas_Object *box, const char *style, const char *text, Evas_Smart_Cb pressed,
                       void *data)
{
    Evas_Object *button = uxt_button_add(box);
    elm_object_style_set(button, style);
    elm_object_domain_translatable_part_text_set(button, nullptr, textDomain, text);
    evas_object_smart_callback_add(button, "clicked", pressed, data);
    append(box, button);
    return button;
}

Evas_Object *addRow(Evas_Object *box)
{
    Evas_Object *row = elm_box_add(box);
    elm_box_horizontal_set(row, EINA_TRUE);
    elm_box_homogeneous_set(row, EINA_TRUE);
    elm_box_padding_set(row, scaled(2 * grid), 0);
    append(box, row);
    return row;
}

Evas_Object *addProgress(Evas_Object *box)
{
    Evas_Object *progress = elm_progressbar_add(box);
    elm_progressbar_pulse_set(progress, EINA_TRUE);
    setAccessibleName(progress, translated(mark("Please wait")));
    append(box, progress);
    evas_object_hide(progress);
    return progress;
}

void setBusy(Evas_Object *progress, bool busy)
{
    elm_progressbar_pulse(progress, busy ? EINA_TRUE : EINA_FALSE);
    if (busy)
        evas_object_show(progress);
    else
        evas_object_hide(progress);
}

Page addPage()
{
    Page page;
    page.window = elm_win_add(nullptr, "korrin", ELM_WIN_BASIC);
    elm_win_title_set(page.window, translated(mark("Pelliko account")));
    addGround(page.window);
    Evas_Object *scroller = elm_scroller_add(page.window);
    elm_scroller_policy_set(scroller, ELM_SCROLLER_POLICY_OFF, ELM_SCROLLER_POLICY_AUTO);
    elm_scroller_bounce_set(scroller, EINA_FALSE, EINA_FALSE);
    evas_object_size_hint_weight_set(scroller, EVAS_HINT_EXPAND, EVAS_HINT_EXPAND);
    elm_win_resize_object_add(page.window, scroller);
    evas_object_show(scroller);
    Evas_Object *middle = elm_box_add(page.window);
    evas_object_size_hint_weight_set(middle, EVAS_HINT_EXPAND, EVAS_HINT_EXPAND);
    elm_object_content_set(scroller, middle);
    page.column = elm_box_add(page.window);
    elm_box_padding_set(page.column, 0, scaled(grid));
    evas_object_size_hint_weight_set(page.column, EVAS_HINT_EXPAND, EVAS_HINT_EXPAND);
    evas_object_size_hint_align_set(page.column, EVAS_HINT_FILL, 0.5);
    evas_object_size_hint_max_set(page.column, scaled(columnWidth), -1);
    evas_object_size_hint_padding_set(page.column, scaled(2 * grid), scaled(2 * grid),
                                      scaled(3 * grid), scaled(3 * grid));
    elm_box_pack_end(middle, page.column);
    evas_object_show(page.column);
    evas_object_resize(page.window, scaled(windowWidth), scaled(windowHeight));
    return page;
}

} // namespace pelliko::signin
