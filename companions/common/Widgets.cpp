#include "Widgets.h"

#include "AccessibleName.h"
#include "CText.h"
#include "Language.h"
#include "Theme.h"

#include <uxt_button.h>
#include <uxt_theme.h>

namespace pelliko::companion
{
namespace
{

constexpr int grid = 8;
constexpr int windowWidth = 480;
constexpr int windowHeight = 800;
constexpr int columnWidth = 440;

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

// A handset's screen belongs to the program that is in front.
void fitToScreen(Evas_Object *window)
{
    int width = 0;
    int height = 0;
    elm_win_screen_size_get(window, nullptr, nullptr, &width, &height);
    evas_object_resize(window, scaled(windowWidth), scaled(windowHeight));
    if (height > width)
        elm_win_maximized_set(window, EINA_TRUE);
}

Evas_Object *addScroller(Evas_Object *window)
{
    Evas_Object *scroller = elm_scroller_add(window);
    elm_scroller_policy_set(scroller, ELM_SCROLLER_POLICY_OFF, ELM_SCROLLER_POLICY_AUTO);
    elm_scroller_bounce_set(scroller, EINA_FALSE, EINA_FALSE);
    evas_object_size_hint_weight_set(scroller, EVAS_HINT_EXPAND, EVAS_HINT_EXPAND);
    elm_win_resize_object_add(window, scroller);
    evas_object_show(scroller);
    return scroller;
}

Evas_Object *addColumn(Evas_Object *window, Evas_Object *middle, double align)
{
    Evas_Object *column = elm_box_add(window);
    elm_box_padding_set(column, 0, scaled(grid));
    evas_object_size_hint_weight_set(column, EVAS_HINT_EXPAND, EVAS_HINT_EXPAND);
    evas_object_size_hint_align_set(column, EVAS_HINT_FILL, align);
    evas_object_size_hint_max_set(column, scaled(columnWidth), -1);
    evas_object_size_hint_padding_set(column, scaled(2 * grid), scaled(2 * grid), scaled(3 * grid),
                                      scaled(3 * grid));
    elm_box_pack_end(middle, column);
    evas_object_show(column);
    return column;
}

void nameAgain(void *text, Evas_Object *object, void *)
{
    setAccessibleName(object, translated(static_cast<const char *>(text)));
}

void titleAgain(void *title, Evas_Object *window, void *)
{
    elm_win_title_set(window, translated(static_cast<const char *>(title)));
}

// Called with a literal, now and whenever the toolkit says that the language is another.
void sayInEveryLanguage(Evas_Object *object, const char *text, Evas_Smart_Cb say)
{
    void *data = const_cast<char *>(text);
    say(data, object, nullptr);
    evas_object_smart_callback_add(object, "language,changed", say, data);
}

} // namespace

void setTranslatedName(Evas_Object *object, const char *text)
{
    sayInEveryLanguage(object, text, nameAgain);
}

void append(Evas_Object *box, Evas_Object *part)
{
    evas_object_size_hint_weight_set(part, EVAS_HINT_EXPAND, 0.0);
    evas_object_size_hint_align_set(part, EVAS_HINT_FILL, 0.5);
    elm_box_pack_end(box, part);
    evas_object_show(part);
}

Evas_Object *addText(Evas_Object *box, const char *style, const char *text)
{
    Evas_Object *label = elm_label_add(box);
    elm_object_style_set(label, (std::string("companion/") + style).c_str());
    elm_label_line_wrap_set(label, ELM_WRAP_MIXED);
    elm_object_domain_translatable_part_text_set(label, nullptr, textDomain(), text);
    append(box, label);
    return label;
}

void setText(Evas_Object *label, const std::string &words)
{
    const CText markup(elm_entry_utf8_to_markup(words.c_str()));
    elm_object_domain_translatable_part_text_set(label, nullptr, textDomain(), nullptr);
    elm_object_text_set(label, markup ? markup.get() : "");
    setAccessibleName(label, words.c_str());
}

Evas_Object *addPlace(Evas_Object *box)
{
    Evas_Object *place = elm_box_add(box);
    append(box, place);
    return place;
}

void setPlaceText(Evas_Object *place, const char *style, const std::string &words)
{
    Eina_List *children = elm_box_children_get(place);
    auto *label = static_cast<Evas_Object *>(eina_list_data_get(children));
    eina_list_free(children);
    if (words.empty())
        elm_box_clear(place);
    else
        setText(label ? label : addText(place, style, ""), words);
}

Evas_Object *addButton(Evas_Object *box, const char *style, const char *text, Evas_Smart_Cb pressed,
                       void *data)
{
    Evas_Object *button = uxt_button_add(box);
    elm_object_style_set(button, style);
    elm_object_domain_translatable_part_text_set(button, nullptr, textDomain(), text);
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

Evas_Object *addProgress(Evas_Object *box, const char *name)
{
    Evas_Object *progress = elm_progressbar_add(box);
    elm_progressbar_pulse_set(progress, EINA_TRUE);
    setTranslatedName(progress, name);
    append(box, progress);
    evas_object_hide(progress);
    return progress;
}

Evas_Object *addBar(Evas_Object *box, const char *name)
{
    Evas_Object *bar = elm_progressbar_add(box);
    elm_object_style_set(bar, "companion");
    setTranslatedName(bar, name);
    append(box, bar);
    return bar;
}

void setBusy(Evas_Object *progress, bool busy)
{
    elm_progressbar_pulse(progress, busy ? EINA_TRUE : EINA_FALSE);
    if (busy)
        evas_object_show(progress);
    else
        evas_object_hide(progress);
}

Page addPage(const char *name, const char *title, double align)
{
    Page page;
    page.window = elm_win_add(nullptr, name, ELM_WIN_BASIC);
    sayInEveryLanguage(page.window, title, titleAgain);
    elm_win_focus_highlight_enabled_set(page.window, EINA_TRUE);
    elm_win_focus_highlight_style_set(page.window, "companion");
    addGround(page.window);
    page.scroller = addScroller(page.window);
    Evas_Object *middle = elm_box_add(page.window);
    evas_object_size_hint_weight_set(middle, EVAS_HINT_EXPAND, EVAS_HINT_EXPAND);
    elm_object_content_set(page.scroller, middle);
    page.column = addColumn(page.window, middle, align);
    fitToScreen(page.window);
    return page;
}

} // namespace pelliko::companion
