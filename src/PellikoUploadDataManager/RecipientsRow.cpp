#include "PellikoUploadDataManager/RecipientsRow.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/AccessibleName.h"
#include "PellikoApp/AppData.h"
#include "PellikoApp/ThemeLayout.h"
#include "PellikoUploadDataManager/Initials.h"
#include "PellikoUploadDataManager/WholePicture.h"

#include <Elementary.h>
#include <cmath>
#include <efl_assist.h>
#include <string>
#include <uxt_theme.h>

namespace pelliko
{

namespace
{

#define IMAGE_DIRECTORY "/opt/usr/apps/com.velmora.pelliko/res/images/sender-images/WVGA/"
constexpr const char *maskImage = IMAGE_DIRECTORY "pk_caller_id_default_masking.png";
constexpr const char *defaultImage = IMAGE_DIRECTORY "pk_caller_id_default.png";
constexpr const char *smsBadge = IMAGE_DIRECTORY "pk_badge_ic_sms.png";
#undef IMAGE_DIRECTORY

constexpr const char *rowPart = "elm.swallow.scroller";
constexpr int badgeSize = 30; ///< pixels at the application's base scale

void _tint(Evas_Object *image, const char *color_class)
{
    int r = 255, g = 255, b = 255, a = 255;
    uxt_theme_get_color(color_class, &r, &g, &b, &a);
    evas_color_argb_premul(a, &r, &g, &b);
    evas_object_color_set(image, r, g, b, a);
}

// Null when the file cannot be shown: the theme has its own drawing for its place.
Evas_Object *_withFile(Evas_Object *image, const char *file)
{
    if (isWholePicture(evas_object_evas_get(image), file) &&
        elm_image_file_set(image, file, nullptr))
        return image;
    LOG_ERROR("the picture %s cannot be shown", file);
    evas_object_del(image);
    return nullptr;
}

Evas_Object *_addImage(Evas_Object *parent, const char *file)
{
    return _withFile(elm_image_add(parent), file);
}

// The person's picture, or null when there is none that can be read.
Evas_Object *_addPersonImage(Evas_Object *item, const char *path)
{
    if (!path || !*path)
        return nullptr;
    LOG_DEBUG("Setting recipient image = %s", path);
    Evas_Object *image = _addImage(item, path);
    if (image && !ea_image_mask_set(image, maskImage))
        LOG_ERROR("the picture could not be rounded");
    return image;
}

Evas_Object *_addDefaultImage(Evas_Object *item)
{
    LOG_DEBUG("Setting default contact image = %s", defaultImage);
    Evas_Object *image = _addImage(item, defaultImage);
    if (image)
        _tint(image, "AO003L1");
    return image;
}

void _tell(Evas_Object *item, const std::string &signal)
{
    elm_object_signal_emit(item, ("pelliko," + signal).c_str(), "pelliko");
}

// The theme lays them over the default picture.
void _showInitials(Evas_Object *item, const char *name)
{
    const std::string initials = initialsOf(name);
    if (initials.empty())
        return;
    edje_object_part_text_set(elm_layout_edje_get(item), "initials", initials.c_str());
    _tell(item, "initials," + std::to_string(initialsGround(name)));
}

void _setPicture(Evas_Object *item, const RowPerson &person)
{
    Evas_Object *image = _addPersonImage(item, person.image_path);
    if (!image) {
        image = _addDefaultImage(item);
        _showInitials(item, person.name);
    }
    if (image)
        elm_object_part_content_set(item, "elm.swallow.icon", image);
    else
        _tell(item, "picture,missing");
}

void _setBadge(Evas_Object *item)
{
    LOG_DEBUG("Setting SMS badge.");
    Evas_Object *badge = _withFile(elm_icon_add(item), smsBadge);
    if (!badge) {
        _tell(item, "badge,missing");
        return;
    }
    setAccessibleName(badge, "SMS");
    _tint(badge, "AO004");
    const double scale =
        edje_object_scale_get(elm_layout_edje_get(item)) / elm_app_base_scale_get();
    const int size = static_cast<int>(std::lround(badgeSize * scale));
    evas_object_size_hint_min_set(badge, size, size);
    evas_object_size_hint_max_set(badge, size, size);
    elm_object_part_content_set(item, "sms.badge", badge);
    _tell(item, "badge,shown");
}

Evas_Object *_addPerson(Evas_Object *box, PellikoAppData *ad, const RowPerson &person)
{
    Evas_Object *item = addThemeLayout(box, ad->theme, "1icon.1text.remoteshare");
    elm_object_part_text_set(item, "elm.text", person.name ? person.name : "");
    _setPicture(item, person);
    if (person.by_sms)
        _setBadge(item);
    elm_object_signal_emit(item, "elm,state,disabled", "elm");
    evas_object_show(item);
    return item;
}

// Sideways only; the bar tells on a desktop that there is more.
Evas_Object *_addScroller(Evas_Object *parent, Elm_Theme *theme)
{
    Evas_Object *scroller = elm_scroller_add(parent);
    elm_object_theme_set(scroller, theme);
    elm_object_style_set(scroller, "pelliko");
    elm_scroller_policy_set(scroller, ELM_SCROLLER_POLICY_AUTO, ELM_SCROLLER_POLICY_OFF);
    elm_scroller_bounce_set(scroller, EINA_FALSE, EINA_FALSE);
    elm_scroller_content_min_limit(scroller, EINA_FALSE, EINA_TRUE);
    // Nothing in it can be acted on, and the keyboard would not find its way out again.
    elm_object_tree_focus_allow_set(scroller, EINA_FALSE);
    return scroller;
}

Evas_Object *_addBox(Evas_Object *scroller, RowCells cells)
{
    Evas_Object *box = elm_box_add(scroller);
    elm_box_horizontal_set(box, EINA_TRUE);
    elm_box_homogeneous_set(box, cells == RowCells::equal);
    evas_object_size_hint_weight_set(box, EVAS_HINT_EXPAND, EVAS_HINT_EXPAND);
    evas_object_size_hint_align_set(box, EVAS_HINT_FILL, EVAS_HINT_FILL);
    elm_box_align_set(box, 0.5, 0.0);
    elm_object_content_set(scroller, box);
    return box;
}

} // namespace

void putRecipientsRow(PellikoAppData *ad, const std::vector<RowPerson> &people, RowCells cells)
{
    forgetWholePictures();
    Evas_Object *layout = addThemeLayout(ad->popup_layout, ad->theme, "scroller.swallow");
    Evas_Object *scroller = _addScroller(layout, ad->theme);
    Evas_Object *box = _addBox(scroller, cells);
    for (const RowPerson &person : people)
        elm_box_pack_end(box, _addPerson(box, ad, person));
    elm_object_part_content_set(layout, "elm.swallow.content", scroller);
    // A content that takes an occupied place deletes the one before it.
    elm_object_part_content_set(ad->popup_layout, rowPart, layout);
}

void addRecipientsFromUploadData(PellikoAppData *ad)
{
    if (!ad || !ad->popup_layout || !ad->upload_item)
        return;
    std::vector<RowPerson> people;
    for (const Eina_List *node = ad->upload_item->recipient_list; node;
         node = eina_list_next(node)) {
        const auto *recipient = static_cast<const UploadRecipient *>(eina_list_data_get(node));
        LOG_DEBUG("Adding recipient- name = %s", textOrNull(recipient->name));
        people.push_back({recipient->name, recipient->image_path, recipient->is_sms == 1});
    }
    putRecipientsRow(ad, people, RowCells::by_name);
}

} // namespace pelliko
