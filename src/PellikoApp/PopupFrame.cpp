#include "PellikoApp/PopupFrame.h"

#include "PellikoApp/AppData.h"
#include "PellikoApp/CText.h"
#include "PellikoApp/ThemeLayout.h"

#include <Elementary.h>
#include <algorithm>
#include <array>
#include <cmath>
#include <cstdlib>

namespace pelliko
{

namespace
{

constexpr const char *widthPart = "pelliko.width";
constexpr std::array<const char *, 2> controlParts{"elm.swallow.checkbox", "cancel_btn_area"};
constexpr const char *frameGroup = "elm/popup/base/pelliko";

// What a layout that was put into a popup needs to know of its surroundings. Lives with the layout.
struct Frame {
    Evas_Object *win, *popup, *scroller, *layout;
    Evas_Object *width,
        *room; ///< rectangles that nobody sees: how wide lines are, what the middle takes
    Evas_Coord last_width, last_height; ///< what was asked for last
};

int _themePixels(const char *name)
{
    const CText value(edje_file_data_get(themeFile().c_str(), name));
    return value ? atoi(value.get()) : 0;
}

double _scaleOf(const Evas_Object *popup)
{
    return elm_config_scale_get() * elm_object_scale_get(popup);
}

// Title, buttons and margins: what the theme's frame takes with nothing in its middle.
Evas_Coord _frameHeight(const Frame &frame, Evas_Coord card_width)
{
    Evas_Object *probe = edje_object_add(evas_object_evas_get(frame.popup));
    edje_object_file_set(probe, themeFile().c_str(), frameGroup);
    edje_object_scale_set(probe, _scaleOf(frame.popup));
    edje_object_part_text_set(probe, "elm.text.title",
                              elm_object_part_text_get(frame.popup, "title,text"));
    for (const char *signal : {"elm,state,title,text,visible", "elm,state,action_area,visible"})
        edje_object_signal_emit(probe, signal, "elm");
    edje_object_message_signal_process(probe);
    Evas_Coord height = 0;
    edje_object_size_min_restricted_calc(probe, nullptr, &height, card_width, 0);
    evas_object_del(probe);
    return height;
}

// A scroller that holds nothing for the keyboard would take it, and not give it back.
void _guardKeyboard(const Frame &frame)
{
    const bool has_control =
        std::any_of(controlParts.begin(), controlParts.end(), [&frame](const char *part) {
            return elm_object_part_content_get(frame.layout, part) != nullptr;
        });
    if (elm_object_tree_focus_allow_get(frame.scroller) != has_control)
        elm_object_tree_focus_allow_set(frame.scroller, has_control);
}

void _fit(Frame &frame)
{
    _guardKeyboard(frame);
    Evas_Coord win_width = 0, win_height = 0, height = 0;
    evas_object_geometry_get(frame.win, nullptr, nullptr, &win_width, &win_height);
    const double scale = _scaleOf(frame.popup);
    const auto pixels = [scale](const char *name) {
        return static_cast<Evas_Coord>(std::lround(_themePixels(name) * scale));
    };
    const Evas_Coord card = std::min(win_width, pixels("card_most"));
    const Evas_Coord width = std::max(card - 2 * pixels("card_margin"), 0);
    evas_object_size_hint_min_set(frame.width, width, 0);
    edje_object_size_min_restricted_calc(elm_layout_edje_get(frame.layout), nullptr, &height, width,
                                         0);
    height = std::min(height, std::max(win_height - _frameHeight(frame, card), 0));
    if (width == frame.last_width && height == frame.last_height)
        return;
    frame.last_width = width;
    frame.last_height = height;
    evas_object_size_hint_min_set(frame.room, width, height);
}

void _surroundingsChangedCb(void *data, Evas *, Evas_Object *, void *)
{
    _fit(*static_cast<Frame *>(data));
}

void _layoutDeletedCb(void *data, Evas *, Evas_Object *, void *)
{
    auto *frame = static_cast<Frame *>(data);
    evas_object_event_callback_del_full(frame->win, EVAS_CALLBACK_RESIZE, _surroundingsChangedCb,
                                        frame);
    delete frame;
}

// Up and down only; the keyboard goes past it to what it holds.
Evas_Object *_addMiddle(Evas_Object *popup, Elm_Theme *theme)
{
    Evas_Object *scroller = elm_scroller_add(popup);
    elm_object_theme_set(scroller, theme);
    elm_object_style_set(scroller, "pelliko/middle");
    elm_scroller_policy_set(scroller, ELM_SCROLLER_POLICY_OFF, ELM_SCROLLER_POLICY_AUTO);
    elm_scroller_bounce_set(scroller, EINA_FALSE, EINA_FALSE);
    elm_object_focus_allow_set(scroller, EINA_FALSE);
    evas_object_size_hint_weight_set(scroller, EVAS_HINT_EXPAND, EVAS_HINT_EXPAND);
    evas_object_size_hint_align_set(scroller, EVAS_HINT_FILL, EVAS_HINT_FILL);
    evas_object_show(scroller);
    return scroller;
}

Evas_Object *_addStrut(Evas_Object *parent)
{
    Evas_Object *strut = evas_object_rectangle_add(evas_object_evas_get(parent));
    evas_object_color_set(strut, 0, 0, 0, 0);
    evas_object_pass_events_set(strut, EINA_TRUE);
    return strut;
}

} // namespace

void fitPopupScale(const PellikoAppData *ad, Evas_Object *popup)
{
    Evas_Coord width = 0, height = 0;
    evas_object_geometry_get(ad->win, nullptr, nullptr, &width, &height);
    const double least = _themePixels("phone_least") * elm_config_scale_get();
    if (least > 0 && std::min(width, height) > 0)
        elm_object_scale_set(popup, std::min(1.0, std::min(width, height) / least));
}

void putPopupContent(PellikoAppData *ad, Evas_Object *popup, Evas_Object *layout)
{
    Evas_Object *scroller = _addMiddle(popup, ad->theme);
    Evas_Object *width = _addStrut(layout), *room = _addStrut(popup);
    elm_object_part_content_set(layout, widthPart, width);
    elm_object_content_set(scroller, layout);
    // A scroller forgets the size that it is told to have; beside it in a cell that size holds.
    Evas_Object *cell = elm_table_add(popup);
    elm_table_pack(cell, room, 0, 0, 1, 1);
    elm_table_pack(cell, scroller, 0, 0, 1, 1);
    elm_object_content_set(popup, cell);
    auto *frame = new Frame{ad->win, popup, scroller, layout, width, room, -1, -1};
    evas_object_event_callback_add(layout, EVAS_CALLBACK_CHANGED_SIZE_HINTS, _surroundingsChangedCb,
                                   frame);
    evas_object_event_callback_add(ad->win, EVAS_CALLBACK_RESIZE, _surroundingsChangedCb, frame);
    evas_object_event_callback_add(layout, EVAS_CALLBACK_DEL, _layoutDeletedCb, frame);
    _fit(*frame);
}

} // namespace pelliko
