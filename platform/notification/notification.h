/*
 * Notifications in the panel.
 *
 * A handle is a plain object of the process; what is shown is the copy that the panel service keeps
 * under a private id after notification_post. Freeing a handle therefore never removes a shown
 * notification.
 *
 * Every function returns NOTIFICATION_ERROR_NONE or a negative notification_error_e. A null handle
 * or null out-pointer gives NOTIFICATION_ERROR_INVALID_PARAMETER; a failing function leaves its
 * out-parameter untouched. Functions that reach the panel service block until it has accepted the
 * change on disk. A handle may be used from one thread at a time.
 */
#ifndef PELLIKO_PLATFORM_NOTIFICATION_H
#define PELLIKO_PLATFORM_NOTIFICATION_H

#include <time.h>

#include <notification_status.h>
#include <tizen.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef struct _notification *notification_h;

typedef enum _notification_type {
    NOTIFICATION_TYPE_NONE = -1,
    NOTIFICATION_TYPE_NOTI = 0,    /* disappears when tapped or swiped */
    NOTIFICATION_TYPE_ONGOING = 1, /* stays until its application deletes it */
    NOTIFICATION_TYPE_MAX
} notification_type_e;

typedef enum _notification_ly_type {
    NOTIFICATION_LY_NONE = 0,
    NOTIFICATION_LY_NOTI_EVENT_SINGLE = 1,
    NOTIFICATION_LY_NOTI_EVENT_MULTIPLE = 2,
    NOTIFICATION_LY_NOTI_THUMBNAIL = 3,
    NOTIFICATION_LY_ONGOING_EVENT = 4,
    NOTIFICATION_LY_ONGOING_PROGRESS = 5,
    NOTIFICATION_LY_MAX
} notification_ly_type_e;

typedef enum _notification_image_type {
    NOTIFICATION_IMAGE_TYPE_NONE = -1,
    NOTIFICATION_IMAGE_TYPE_ICON = 0,
    NOTIFICATION_IMAGE_TYPE_ICON_FOR_INDICATOR = 1,
    NOTIFICATION_IMAGE_TYPE_ICON_FOR_LOCK = 2,
    NOTIFICATION_IMAGE_TYPE_THUMBNAIL = 3,
    NOTIFICATION_IMAGE_TYPE_THUMBNAIL_FOR_LOCK = 4,
    NOTIFICATION_IMAGE_TYPE_ICON_SUB = 5,
    NOTIFICATION_IMAGE_TYPE_BACKGROUND = 6,
    NOTIFICATION_IMAGE_TYPE_MAX
} notification_image_type_e;

typedef enum _notification_text_type {
    NOTIFICATION_TEXT_TYPE_NONE = -1,
    NOTIFICATION_TEXT_TYPE_TITLE = 0,
    NOTIFICATION_TEXT_TYPE_CONTENT = 1,
    NOTIFICATION_TEXT_TYPE_CONTENT_FOR_DISPLAY_OPTION_IS_OFF = 2,
    NOTIFICATION_TEXT_TYPE_EVENT_COUNT = 3,
    NOTIFICATION_TEXT_TYPE_INFO_1 = 4,
    NOTIFICATION_TEXT_TYPE_MAX
} notification_text_type_e;

/* Kinds of the variable arguments of notification_set_text. */
typedef enum _notifcation_variable_type {
    NOTIFICATION_VARIABLE_TYPE_NONE = -1,  /* ends the list */
    NOTIFICATION_VARIABLE_TYPE_INT = 0,    /* int */
    NOTIFICATION_VARIABLE_TYPE_DOUBLE = 1, /* double */
    NOTIFICATION_VARIABLE_TYPE_STRING = 2, /* const char * */
    NOTIFICATION_VARIABLE_TYPE_COUNT = 3,  /* int */
    NOTIFICATION_VARIABLE_TYPE_MAX
} notification_variable_type_e;

/* Where a notification appears; the bits are or-ed. */
enum _notification_display_app {
    NOTIFICATION_DISPLAY_APP_NOTIFICATION_TRAY = 0x00000001,
    NOTIFICATION_DISPLAY_APP_TICKER = 0x00000002,
    NOTIFICATION_DISPLAY_APP_LOCK = 0x00000004,
    NOTIFICATION_DISPLAY_APP_INDICATOR = 0x00000008,
    NOTIFICATION_DISPLAY_APP_ALL = ~0
};

typedef enum _notification_sound_type {
    NOTIFICATION_SOUND_TYPE_NONE = -1,
    NOTIFICATION_SOUND_TYPE_DEFAULT = 0,
    NOTIFICATION_SOUND_TYPE_USER_DATA = 1,
    NOTIFICATION_SOUND_TYPE_MAX
} notification_sound_type_e;

typedef enum notification_launch_option_type {
    NOTIFICATION_LAUNCH_OPTION_APP_CONTROL = 1
} notification_launch_option_type;

typedef enum _notification_error {
    NOTIFICATION_ERROR_NONE = TIZEN_ERROR_NONE,
    NOTIFICATION_ERROR_INVALID_PARAMETER = TIZEN_ERROR_INVALID_PARAMETER,
    NOTIFICATION_ERROR_OUT_OF_MEMORY = TIZEN_ERROR_OUT_OF_MEMORY,
    NOTIFICATION_ERROR_IO_ERROR = TIZEN_ERROR_IO_ERROR,
    NOTIFICATION_ERROR_PERMISSION_DENIED = TIZEN_ERROR_PERMISSION_DENIED,
    NOTIFICATION_ERROR_FROM_DB = TIZEN_ERROR_NOTIFICATION | 0x01,
    NOTIFICATION_ERROR_ALREADY_EXIST_ID = TIZEN_ERROR_NOTIFICATION | 0x02,
    NOTIFICATION_ERROR_FROM_DBUS = TIZEN_ERROR_NOTIFICATION | 0x03,
    NOTIFICATION_ERROR_NOT_EXIST_ID = TIZEN_ERROR_NOTIFICATION | 0x04,
    NOTIFICATION_ERROR_SERVICE_NOT_READY = TIZEN_ERROR_NOTIFICATION | 0x05
} notification_error_e;

/**
 * A new handle that the caller frees with notification_free. Layout: single event for a normal
 * notification, progress for an ongoing one; display list: everywhere. NULL on failure, with the
 * reason in get_last_result().
 */
notification_h notification_create(notification_type_e type);
/** Frees the handle only; what was posted stays in the panel. */
int notification_free(notification_h noti);
/** A deep copy in *clone, freed by the caller; it refers to the same posted notification. */
int notification_clone(notification_h noti, notification_h *clone);

int notification_get_type(notification_h noti, notification_type_e *type);
int notification_set_layout(notification_h noti, notification_ly_type_e layout);
int notification_get_layout(notification_h noti, notification_ly_type_e *layout);
/** Copies the path, which need not exist and may name a "reserved://" picture of the panel; NULL
 * clears it. */
int notification_set_image(notification_h noti, notification_image_type_e type,
                           const char *image_path);
/** *image_path is borrowed from the handle, NULL when it was never set. */
int notification_get_image(notification_h noti, notification_image_type_e type, char **image_path);
/** Seconds since the epoch; 0 stands for the time of the call. */
int notification_set_time(notification_h noti, time_t input_time);
/** 0 when no time was set. */
int notification_get_time(notification_h noti, time_t *ret_time);
/**
 * Sets a text as it is to be shown; NULL clears it. key (may be NULL) is the message id that the
 * text was translated from. The remaining arguments are pairs of notification_variable_type_e and
 * value, the first type being args_type, ended by NOTIFICATION_VARIABLE_TYPE_NONE; an unknown type
 * is NOTIFICATION_ERROR_INVALID_PARAMETER and leaves the handle unchanged. All texts are copied.
 */
int notification_set_text(notification_h noti, notification_text_type_e type, const char *text,
                          const char *key, int args_type, ...);
/** *text is borrowed from the handle, valid until it is changed or freed; NULL when that text was
 * never set. */
int notification_get_text(notification_h noti, notification_text_type_e type, char **text);
int notification_set_sound(notification_h noti, notification_sound_type_e type, const char *path);
/** Replaces the whole set of _notification_display_app bits. */
int notification_set_display_applist(notification_h noti, int applist);
int notification_get_display_applist(notification_h noti, int *applist);
/**
 * What a tap does. option is the app_control_h itself, whose contents are copied; the caller
 * destroys its own request whenever it likes. Only NOTIFICATION_LAUNCH_OPTION_APP_CONTROL is known.
 */
int notification_set_launch_option(notification_h noti, notification_launch_option_type type,
                                   void *option);
/** option is an app_control_h *; gives a new request that the caller destroys, NULL when none was
 * set. */
int notification_get_launch_option(notification_h noti, notification_launch_option_type type,
                                   void *option);
/** 0.0 to 1.0; changes the handle only, until notification_update. */
int notification_set_progress(notification_h noti, double percentage);
int notification_get_progress(notification_h noti, double *percentage);
/** Copies the tag. At most one posted notification of an application has a given tag. */
int notification_set_tag(notification_h noti, const char *tag);
/** *tag is borrowed from the handle, NULL when none was set. */
int notification_get_tag(notification_h noti, const char **tag);

/**
 * Shows the notification under a new private id that the handle remembers. A posted notification of
 * the same application with the same tag is replaced, whatever its type.
 * NOTIFICATION_ERROR_ALREADY_EXIST_ID when this handle's notification is still posted: change it
 * with notification_update.
 */
int notification_post(notification_h noti);
/** Sends the handle's whole content. NOTIFICATION_ERROR_NOT_EXIST_ID when it is not posted (any
 * more). */
int notification_update(notification_h noti);
/** Removes the posted notification; the handle stays and must still be freed. NOT_EXIST_ID when
 * there is none. */
int notification_delete(notification_h noti);
/** Removes all posted notifications of this application of the type, NOTIFICATION_TYPE_NONE meaning
 * all types. */
int notification_delete_all(notification_type_e type);
/**
 * A new handle with a copy of this application's posted notification that carries the tag, freed by
 * the caller. NULL when there is none, with the reason in get_last_result().
 */
notification_h notification_load_by_tag(const char *tag);

#ifdef __cplusplus
}
#endif

#endif
