// A program that shows the picture of a confirmation popup and does nothing else: no bus, no
// contacts, no files, no settings. What the application costs beyond this is what it does for the
// share.

#include <Elementary.h>

#include <cmath>
#include <cstdio>
#include <efl_util.h>
#include <string>
#include <uxt_button.h>
#include <uxt_theme.h>

namespace
{

constexpr const char *home = "/opt/usr/apps/com.velmora.pelliko/";
constexpr const char *pictures = "res/images/sender-images/WVGA/";
constexpr double appScale = 1.8;
constexpr int badgeSize = 30;

constexpr int margin = 24; ///< beside the popup's contents

struct Shown {
    std::string person;   ///< name of the one recipient
    std::string initials; ///< what stands for their picture
    std::string ground;   ///< the number of its colour
    std::string summary;  ///< number and size of the files
};

std::string path(const char *name)
{
    return std::string(home) + name;
}

Elm_Theme *makeTheme()
{
    Elm_Theme *theme = elm_theme_new();
    elm_theme_ref_set(theme, nullptr);
    elm_theme_extension_add(theme, path("res/edje/pelliko.edj").c_str());
    return theme;
}

void useTables()
{
    constexpr const char *tables = "shared/res/tables/com.velmora.pelliko_";
    uxt_theme_set_changeable_ui_enabled(EINA_TRUE);
    uxt_theme_set_color_table(
        uxt_theme_add_color_table((path(tables) + "ChangeableColorTable.xml").c_str()));
    uxt_theme_set_font_table(
        uxt_theme_add_font_table((path(tables) + "FontInfoTable.xml").c_str()));
}

Evas_Object *addWindow()
{
    Evas_Object *win = elm_win_add(nullptr, "plain-popup", ELM_WIN_NOTIFICATION);
    elm_win_alpha_set(win, EINA_TRUE);
    efl_util_set_notification_window_level(win, EFL_UTIL_NOTIFICATION_LEVEL_DEFAULT);
    elm_win_title_set(win, "plain-popup");
    elm_win_conformant_set(win, EINA_FALSE);
    elm_win_autodel_set(win, EINA_TRUE);
    evas_object_show(win);
    useTables();
    return win;
}

Evas_Object *addLayout(Evas_Object *parent, Elm_Theme *theme, const char *group)
{
    Evas_Object *layout = elm_layout_add(parent);
    elm_object_theme_set(layout, theme);
    elm_layout_file_set(layout, path("res/edje/pelliko.edj").c_str(), group);
    evas_object_size_hint_weight_set(layout, EVAS_HINT_EXPAND, EVAS_HINT_EXPAND);
    evas_object_size_hint_align_set(layout, EVAS_HINT_FILL, EVAS_HINT_FILL);
    return layout;
}

Evas_Object *addPicture(Evas_Object *item, const char *name, const char *colorClass)
{
    Evas_Object *image = elm_image_add(item);
    elm_image_file_set(image, (path(pictures) + name).c_str(), nullptr);
    int r = 255, g = 255, b = 255, a = 255;
    uxt_theme_get_color(colorClass, &r, &g, &b, &a);
    evas_color_argb_premul(a, &r, &g, &b);
    evas_object_color_set(image, r, g, b, a);
    return image;
}

Evas_Object *addPerson(Evas_Object *box, Elm_Theme *theme, const Shown &shown)
{
    Evas_Object *item = addLayout(box, theme, "1icon.1text.remoteshare");
    elm_object_part_text_set(item, "elm.text", shown.person.c_str());
    elm_object_part_content_set(item, "elm.swallow.icon",
                                addPicture(item, "pk_caller_id_default.png", "AO003L1"));
    edje_object_part_text_set(elm_layout_edje_get(item), "initials", shown.initials.c_str());
    elm_object_signal_emit(item, ("pelliko,initials," + shown.ground).c_str(), "pelliko");
    Evas_Object *badge = addPicture(item, "pk_badge_ic_sms.png", "AO004");
    const double scale = elm_config_scale_get() / elm_app_base_scale_get();
    const int size = static_cast<int>(std::lround(badgeSize * scale));
    evas_object_size_hint_min_set(badge, size, size);
    evas_object_size_hint_max_set(badge, size, size);
    elm_object_part_content_set(item, "sms.badge", badge);
    elm_object_signal_emit(item, "pelliko,badge,shown", "pelliko");
    elm_object_signal_emit(item, "elm,state,disabled", "elm");
    evas_object_show(item);
    return item;
}

void addRow(Evas_Object *layout, Elm_Theme *theme, const Shown &shown)
{
    Evas_Object *row = addLayout(layout, theme, "scroller.swallow");
    Evas_Object *scroller = elm_scroller_add(row);
    elm_object_theme_set(scroller, theme);
    elm_object_style_set(scroller, "pelliko");
    elm_scroller_policy_set(scroller, ELM_SCROLLER_POLICY_AUTO, ELM_SCROLLER_POLICY_OFF);
    elm_scroller_bounce_set(scroller, EINA_FALSE, EINA_FALSE);
    elm_scroller_content_min_limit(scroller, EINA_FALSE, EINA_TRUE);
    elm_object_focus_allow_set(scroller, EINA_FALSE);
    Evas_Object *box = elm_box_add(scroller);
    elm_box_horizontal_set(box, EINA_TRUE);
    evas_object_size_hint_weight_set(box, EVAS_HINT_EXPAND, EVAS_HINT_EXPAND);
    evas_object_size_hint_align_set(box, EVAS_HINT_FILL, EVAS_HINT_FILL);
    elm_box_align_set(box, 0.5, 0.0);
    elm_object_content_set(scroller, box);
    elm_box_pack_end(box, addPerson(box, theme, shown));
    elm_object_part_content_set(row, "elm.swallow.content", scroller);
    elm_object_part_content_set(layout, "elm.swallow.scroller", row);
}

void addTexts(Evas_Object *layout, Elm_Theme *theme, const Shown &shown)
{
    Evas_Object *label = elm_label_add(layout);
    elm_object_style_set(label, "popup/default");
    elm_label_line_wrap_set(label, ELM_WRAP_WORD);
    elm_object_part_content_set(layout, "elm.swallow.box", label);
    elm_object_part_text_set(label, "elm.text", "To avoid extra charges, share via Wi‑Fi only.");
    elm_object_part_text_set(layout, "elm.text.info", shown.summary.c_str());
    Evas_Object *check = elm_check_add(layout);
    elm_object_theme_set(check, theme);
    elm_object_style_set(check, "pelliko");
    elm_object_part_content_set(layout, "elm.swallow.checkbox", check);
    elm_object_part_text_set(layout, "elm.text", "Share via Wi-Fi only");
}

void addButton(Evas_Object *popup, const char *part, const char *style, const char *text)
{
    Evas_Object *button = uxt_button_add(popup);
    elm_object_text_set(button, text);
    elm_object_part_content_set(popup, part, button);
    elm_object_style_set(button, style);
}

// What the popup's middle takes; nobody sees it.
Evas_Object *addStrut(Evas_Object *parent, int width)
{
    Evas_Object *strut = evas_object_rectangle_add(evas_object_evas_get(parent));
    evas_object_color_set(strut, 0, 0, 0, 0);
    evas_object_size_hint_min_set(strut, width, 0);
    return strut;
}

void fitHeight(void *data, Evas *, Evas_Object *layout, void *)
{
    auto *room = static_cast<Evas_Object *>(data);
    int width = 0, height = 0;
    evas_object_size_hint_min_get(room, &width, nullptr);
    edje_object_size_min_restricted_calc(elm_layout_edje_get(layout), nullptr, &height, width, 0);
    evas_object_size_hint_min_set(room, width, height);
}

// As wide as the screen but for the margins, as high as its texts are then, and scrolled where the
// window is lower.
void putContents(Evas_Object *win, Evas_Object *popup, Elm_Theme *theme, Evas_Object *layout)
{
    int width = 0;
    elm_win_screen_size_get(win, nullptr, nullptr, &width, nullptr);
    width -= 2 * static_cast<int>(std::lround(margin * elm_config_scale_get()));
    Evas_Object *room = addStrut(popup, width);
    elm_object_part_content_set(layout, "pelliko.width", addStrut(layout, width));
    Evas_Object *scroller = elm_scroller_add(popup);
    elm_object_theme_set(scroller, theme);
    elm_object_style_set(scroller, "pelliko/middle");
    elm_scroller_policy_set(scroller, ELM_SCROLLER_POLICY_OFF, ELM_SCROLLER_POLICY_AUTO);
    elm_object_focus_allow_set(scroller, EINA_FALSE);
    evas_object_size_hint_weight_set(scroller, EVAS_HINT_EXPAND, EVAS_HINT_EXPAND);
    evas_object_size_hint_align_set(scroller, EVAS_HINT_FILL, EVAS_HINT_FILL);
    elm_object_content_set(scroller, layout);
    evas_object_show(scroller);
    Evas_Object *cell = elm_table_add(popup);
    elm_table_pack(cell, room, 0, 0, 1, 1);
    elm_table_pack(cell, scroller, 0, 0, 1, 1);
    elm_object_content_set(popup, cell);
    evas_object_event_callback_add(layout, EVAS_CALLBACK_CHANGED_SIZE_HINTS, fitHeight, room);
    fitHeight(room, nullptr, layout, nullptr);
}

void showPopup(Evas_Object *win, const Shown &shown)
{
    Elm_Theme *theme = makeTheme();
    Evas_Object *popup = elm_popup_add(win);
    elm_object_theme_set(popup, theme);
    elm_object_style_set(popup, "pelliko");
    elm_popup_align_set(popup, ELM_NOTIFY_ALIGN_FILL, 1.0);
    evas_object_size_hint_weight_set(popup, EVAS_HINT_EXPAND, EVAS_HINT_EXPAND);
    elm_object_part_text_set(popup, "title,text", "Share files via Pelliko");
    Evas_Object *layout = addLayout(popup, theme, "confirmation_popup_share_view_single");
    addTexts(layout, theme, shown);
    addRow(layout, theme, shown);
    addButton(popup, "button1", "popup", "Cancel");
    addButton(popup, "button2", "popup/primary", "Share");
    putContents(win, popup, theme, layout);
    evas_object_show(popup);
    elm_win_raise(win);
    elm_win_activate(win);
    elm_object_focus_set(popup, EINA_TRUE);
}

} // namespace

int main(int argc, char **argv)
{
    if (argc != 5) {
        std::printf(
            "Usage: %s NAME INITIALS GROUND SUMMARY\n"
            "Shows a confirmation popup for one recipient and does nothing else, as the peer of "
            "bench/launch-to-popup.\n",
            argv[0]);
        return argc == 2 && std::string(argv[1]) == "--help" ? 0 : 1;
    }
    elm_init(argc, argv);
    elm_app_base_scale_set(appScale);
    showPopup(addWindow(), {argv[1], argv[2], argv[3], argv[4]});
    elm_run();
    return 0;
}
