// Handles and their simple attributes.
#include "Guard.h"
#include "Handle.h"
#include "notification.h"

using pelliko::platform::guarded;

namespace
{

template <typename Value> int give(notification_h noti, Value *out, Value value)
{
    if (!noti || !out)
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    *out = value;
    return NOTIFICATION_ERROR_NONE;
}

bool isImageKind(notification_image_type_e type)
{
    return type > NOTIFICATION_IMAGE_TYPE_NONE && type < NOTIFICATION_IMAGE_TYPE_MAX;
}

} // namespace

extern "C" {

notification_h notification_create(notification_type_e type)
{
    if (type != NOTIFICATION_TYPE_NOTI && type != NOTIFICATION_TYPE_ONGOING) {
        set_last_result(NOTIFICATION_ERROR_INVALID_PARAMETER);
        return nullptr;
    }
    auto *noti = new (std::nothrow) _notification;
    set_last_result(noti ? NOTIFICATION_ERROR_NONE : NOTIFICATION_ERROR_OUT_OF_MEMORY);
    if (noti) {
        noti->record.type = type;
        noti->record.layout = type == NOTIFICATION_TYPE_ONGOING ? NOTIFICATION_LY_ONGOING_PROGRESS
                                                                : NOTIFICATION_LY_NOTI_EVENT_SINGLE;
        noti->record.display = NOTIFICATION_DISPLAY_APP_ALL;
    }
    return noti;
}

int notification_free(notification_h noti)
{
    if (!noti)
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    delete noti;
    return NOTIFICATION_ERROR_NONE;
}

int notification_clone(notification_h noti, notification_h *clone)
{
    if (!noti || !clone)
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    return guarded([&] {
        *clone = new _notification(*noti);
        return NOTIFICATION_ERROR_NONE;
    });
}

int notification_get_type(notification_h noti, notification_type_e *type)
{
    return give(noti, type,
                noti ? static_cast<notification_type_e>(noti->record.type)
                     : NOTIFICATION_TYPE_NONE);
}

int notification_set_layout(notification_h noti, notification_ly_type_e layout)
{
    if (!noti || layout < NOTIFICATION_LY_NONE || layout >= NOTIFICATION_LY_MAX)
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    noti->record.layout = layout;
    return NOTIFICATION_ERROR_NONE;
}

int notification_get_layout(notification_h noti, notification_ly_type_e *layout)
{
    return give(noti, layout,
                noti ? static_cast<notification_ly_type_e>(noti->record.layout)
                     : NOTIFICATION_LY_NONE);
}

int notification_set_image(notification_h noti, notification_image_type_e type,
                           const char *image_path)
{
    if (!noti || !isImageKind(type))
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    return guarded([&] {
        if (image_path)
            noti->record.images[type] = image_path;
        else
            noti->record.images.erase(type);
        return NOTIFICATION_ERROR_NONE;
    });
}

int notification_get_image(notification_h noti, notification_image_type_e type, char **image_path)
{
    if (!noti || !isImageKind(type) || !image_path)
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    const auto found = noti->record.images.find(type);
    *image_path = found == noti->record.images.end() ? nullptr : found->second.data();
    return NOTIFICATION_ERROR_NONE;
}

int notification_set_time(notification_h noti, time_t input_time)
{
    if (!noti || input_time < 0)
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    noti->record.time = input_time == 0 ? time(nullptr) : input_time;
    return NOTIFICATION_ERROR_NONE;
}

int notification_get_time(notification_h noti, time_t *ret_time)
{
    return give(noti, ret_time, noti ? static_cast<time_t>(noti->record.time) : time_t{0});
}

int notification_set_sound(notification_h noti, notification_sound_type_e type, const char *path)
{
    if (!noti || type < NOTIFICATION_SOUND_TYPE_NONE || type >= NOTIFICATION_SOUND_TYPE_MAX)
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    return guarded([&] {
        noti->record.soundPath = path ? path : "";
        noti->record.sound = type;
        return NOTIFICATION_ERROR_NONE;
    });
}

int notification_set_display_applist(notification_h noti, int applist)
{
    if (!noti)
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    noti->record.display = applist;
    return NOTIFICATION_ERROR_NONE;
}

int notification_get_display_applist(notification_h noti, int *applist)
{
    return give(noti, applist, noti ? noti->record.display : 0);
}

int notification_set_progress(notification_h noti, double percentage)
{
    // Written so that "not a number" is refused as well.
    if (!noti || !(percentage >= 0.0 && percentage <= 1.0))
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    noti->record.progress = percentage;
    return NOTIFICATION_ERROR_NONE;
}

int notification_get_progress(notification_h noti, double *percentage)
{
    return give(noti, percentage, noti ? noti->record.progress : 0.0);
}

int notification_set_tag(notification_h noti, const char *tag)
{
    if (!noti || !tag)
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    return guarded([&] {
        noti->record.tag = tag;
        return NOTIFICATION_ERROR_NONE;
    });
}

int notification_get_tag(notification_h noti, const char **tag)
{
    if (!noti || !tag)
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    *tag = noti->record.tag.empty() ? nullptr : noti->record.tag.c_str();
    return NOTIFICATION_ERROR_NONE;
}
}
