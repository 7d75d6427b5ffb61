// The frame of an application with a user interface: one instance, one main loop, requests in
// order. Everything here belongs to the main loop.
#pragma once

#include "app_common.h"
#include "app_control.h"

#ifdef __cplusplus
extern "C" {
#endif

typedef enum {
    APP_ERROR_NONE = TIZEN_ERROR_NONE,
    APP_ERROR_INVALID_PARAMETER = TIZEN_ERROR_INVALID_PARAMETER,
    APP_ERROR_OUT_OF_MEMORY = TIZEN_ERROR_OUT_OF_MEMORY,
    APP_ERROR_INVALID_CONTEXT = TIZEN_ERROR_APPLICATION | 0x01,
    APP_ERROR_ALREADY_RUNNING = TIZEN_ERROR_APPLICATION | 0x04
} app_error_e;

typedef struct app_event_info *app_event_info_h;
typedef struct app_event_handler *app_event_handler_h;

typedef enum {
    APP_EVENT_LOW_MEMORY,                 /* 0 */
    APP_EVENT_LOW_BATTERY,                /* 1 */
    APP_EVENT_LANGUAGE_CHANGED,           /* 2 */
    APP_EVENT_DEVICE_ORIENTATION_CHANGED, /* 3 */
    APP_EVENT_REGION_FORMAT_CHANGED       /* 4 */
} app_event_type_e;

typedef bool (*app_create_cb)(void *user_data);
typedef void (*app_terminate_cb)(void *user_data);
typedef void (*app_pause_cb)(void *user_data);
typedef void (*app_resume_cb)(void *user_data);
typedef void (*app_control_cb)(app_control_h app_control, void *user_data);
typedef void (*app_event_cb)(app_event_info_h event_info, void *user_data);

/// pause and resume follow the windows, which only app_assist::WApp knows: it raises them itself.
typedef struct {
    app_create_cb create;
    app_terminate_cb terminate;
    app_pause_cb pause;
    app_resume_cb resume;
    app_control_cb app_control;
} ui_app_lifecycle_callback_s;

/// Takes the application's bus name, runs create, then the loop with the requests, then terminate.
/// When another instance has the name, hands this start (or the files on its command line) to that
/// instance instead. Elementary must be initialised. Returns 0 after a normal end or a hand-over;
/// INVALID_PARAMETER without callbacks; INVALID_CONTEXT when there is no bus, the hand-over failed
/// or create returned false.
int ui_app_main(int argc, char **argv, ui_app_lifecycle_callback_s *callback, void *user_data);

/// Asks the loop to end; terminate still runs.
void ui_app_exit(void);

/// Of the event types this host raises APP_EVENT_LANGUAGE_CHANGED only, when the configuration key
/// "db/menu_widget/language" is set.
int ui_app_add_event_handler(app_event_handler_h *handler, app_event_type_e event_type,
                             app_event_cb callback, void *user_data);
int ui_app_remove_event_handler(app_event_handler_h handler);

#ifdef __cplusplus
}
#endif
