// Levels of notification windows.
#pragma once

#include <Elementary.h>

#include "tizen.h"

#ifdef __cplusplus
extern "C" {
#endif

typedef enum {
    EFL_UTIL_NOTIFICATION_LEVEL_1 = 0, /* superseded names */
    EFL_UTIL_NOTIFICATION_LEVEL_2 = 1,
    EFL_UTIL_NOTIFICATION_LEVEL_3 = 2,
    EFL_UTIL_NOTIFICATION_LEVEL_NONE = -1,
    EFL_UTIL_NOTIFICATION_LEVEL_DEFAULT = 10,
    EFL_UTIL_NOTIFICATION_LEVEL_MEDIUM = 20,
    EFL_UTIL_NOTIFICATION_LEVEL_HIGH = 30,
    EFL_UTIL_NOTIFICATION_LEVEL_TOP = 40
} efl_util_notification_level_e;

typedef enum {
    EFL_UTIL_ERROR_NONE = TIZEN_ERROR_NONE,
    EFL_UTIL_ERROR_INVALID_PARAMETER = TIZEN_ERROR_INVALID_PARAMETER,
    EFL_UTIL_ERROR_OUT_OF_MEMORY = TIZEN_ERROR_OUT_OF_MEMORY,
    EFL_UTIL_ERROR_PERMISSION_DENIED = TIZEN_ERROR_PERMISSION_DENIED,
    EFL_UTIL_ERROR_NOT_SUPPORTED_WINDOW_TYPE = TIZEN_ERROR_EFL_UTIL | 0x01
} efl_util_error_e;

/* Makes a notification window one that lies over all others: above-state, no border, over the whole
   screen (what the handset's window manager does by itself). A window of any other type gives
   EFL_UTIL_ERROR_NOT_SUPPORTED_WINDOW_TYPE. The window manager acts later; the result only covers
   the request. Main loop only. */
int efl_util_set_notification_window_level(Evas_Object *window,
                                           efl_util_notification_level_e level);

/* The level set last, EFL_UTIL_NOTIFICATION_LEVEL_NONE when none was (or level 0). */
int efl_util_get_notification_window_level(Evas_Object *window,
                                           efl_util_notification_level_e *level);

#ifdef __cplusplus
}
#endif
