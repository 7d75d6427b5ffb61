#include "Avatar.h"

#include "Words.h"

namespace pelliko::picker
{

namespace
{

// A camera's picture is read no larger than it is shown on a fine display.
constexpr int largest = 96;

bool addPicture(Evas_Object *avatar, const std::string &file)
{
    Evas_Object *picture = elm_image_add(avatar);
    elm_image_prescale_set(picture, largest);
    elm_image_fill_outside_set(picture, EINA_TRUE);
    if (file.empty() || !elm_image_file_set(picture, file.c_str(), nullptr)) {
        evas_object_del(picture);
        return false;
    }
    elm_object_part_content_set(avatar, "elm.swallow.content", picture);
    return true;
}

} // namespace

Evas_Object *addAvatar(Evas_Object *parent, const companion::ContactNumber &person)
{
    Evas_Object *avatar = elm_layout_add(parent);
    elm_layout_theme_set(avatar, "layout", "companion", "avatar");
    if (!addPicture(avatar, person.picture))
        elm_object_part_text_set(avatar, "elm.text", initialsOf(person.name).c_str());
    if (!person.joined)
        elm_layout_signal_emit(avatar, "companion,badge,shown", "companion");
    return avatar;
}

} // namespace pelliko::picker
