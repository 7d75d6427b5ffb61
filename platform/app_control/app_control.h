// Launch requests between applications, and their replies.
//
// A handle may be used by one thread at a time; different handles, clones included, share nothing
// that changes and may be used on different threads. Sending and receiving belong to the main loop;
// answering does not. No toolkit is needed: callbacks come from GLib's default main context.
#pragma once

#include "tizen.h"

#define APP_CONTROL_OPERATION_DEFAULT "http://tizen.org/appcontrol/operation/default"
#define APP_CONTROL_OPERATION_SHARE "http://tizen.org/appcontrol/operation/share"
#define APP_CONTROL_OPERATION_MULTI_SHARE "http://tizen.org/appcontrol/operation/multi_share"
#define APP_CONTROL_OPERATION_SHARE_TEXT "http://tizen.org/appcontrol/operation/share_text"
#define APP_CONTROL_OPERATION_SEND "http://tizen.org/appcontrol/operation/send"
#define APP_CONTROL_OPERATION_SEND_TEXT "http://tizen.org/appcontrol/operation/send_text"
#define APP_CONTROL_OPERATION_VIEW "http://tizen.org/appcontrol/operation/view"
#define APP_CONTROL_DATA_PATH "http://tizen.org/appcontrol/data/path"
#define APP_CONTROL_DATA_TO "http://tizen.org/appcontrol/data/to"
#define APP_CONTROL_DATA_ID "http://tizen.org/appcontrol/data/id"
#define APP_CONTROL_DATA_TEXT "http://tizen.org/appcontrol/data/text"
#define APP_CONTROL_DATA_TYPE "http://tizen.org/appcontrol/data/type"

#include "pelliko_operations.h"

#ifdef __cplusplus
extern "C" {
#endif

typedef struct app_control_s *app_control_h;

typedef enum {
    APP_CONTROL_ERROR_NONE = TIZEN_ERROR_NONE,
    APP_CONTROL_ERROR_INVALID_PARAMETER = TIZEN_ERROR_INVALID_PARAMETER,
    APP_CONTROL_ERROR_OUT_OF_MEMORY = TIZEN_ERROR_OUT_OF_MEMORY,
    APP_CONTROL_ERROR_APP_NOT_FOUND = TIZEN_ERROR_APPLICATION | 0x21,
    APP_CONTROL_ERROR_KEY_NOT_FOUND = TIZEN_ERROR_KEY_NOT_AVAILABLE,
    APP_CONTROL_ERROR_KEY_REJECTED = TIZEN_ERROR_KEY_REJECTED,
    APP_CONTROL_ERROR_INVALID_DATA_TYPE = TIZEN_ERROR_APPLICATION | 0x22,
    APP_CONTROL_ERROR_LAUNCH_REJECTED = TIZEN_ERROR_APPLICATION | 0x23,
    APP_CONTROL_ERROR_PERMISSION_DENIED = TIZEN_ERROR_PERMISSION_DENIED,
    APP_CONTROL_ERROR_LAUNCH_FAILED = TIZEN_ERROR_APPLICATION | 0x24,
    APP_CONTROL_ERROR_TIMED_OUT = TIZEN_ERROR_TIMED_OUT,
    APP_CONTROL_ERROR_IO_ERROR = TIZEN_ERROR_IO_ERROR
} app_control_error_e;

typedef enum {
    APP_CONTROL_RESULT_APP_STARTED = 1, /* the callee really started */
    APP_CONTROL_RESULT_SUCCEEDED = 0,
    APP_CONTROL_RESULT_FAILED = -1,  /* failed by the callee */
    APP_CONTROL_RESULT_CANCELED = -2 /* ended by the framework: nobody answered */
} app_control_result_e;

/// Main loop. `request` and `reply` are valid during the call and freed by the framework
/// afterwards.
typedef void (*app_control_reply_cb)(app_control_h request, app_control_h reply,
                                     app_control_result_e result, void *user_data);

/// An empty request; the caller destroys it.
int app_control_create(app_control_h *app_control);

/// Frees the handle, also while the request it was sent with is pending. Destroying the last handle
/// of a received request that was not answered answers it with CANCELED.
int app_control_destroy(app_control_h app_control);

/// A deep copy with its own life, able to answer the request that the original came from.
int app_control_clone(app_control_h *clone, app_control_h app_control);

/// Setters: NULL removes the attribute. Getters: *out is a copy for free(), or NULL when the
/// attribute is not set; a received request always has an operation.
int app_control_set_operation(app_control_h app_control, const char *operation);
int app_control_get_operation(app_control_h app_control, char **operation);
int app_control_set_uri(app_control_h app_control, const char *uri);
int app_control_get_uri(app_control_h app_control, char **uri);
int app_control_set_mime(app_control_h app_control, const char *mime);
int app_control_get_mime(app_control_h app_control, char **mime);
int app_control_set_app_id(app_control_h app_control, const char *app_id);
int app_control_get_app_id(app_control_h app_control, char **app_id);

/// Sets a text, replacing whatever the key held. A null or empty key or value is INVALID_PARAMETER;
/// a key that begins with "__" belongs to the framework and is KEY_REJECTED.
int app_control_add_extra_data(app_control_h app_control, const char *key, const char *value);

/// Sets an array of `length` (> 0) texts, replacing whatever the key held. An element may be NULL;
/// it reaches another program as an empty text.
int app_control_add_extra_data_array(app_control_h app_control, const char *key,
                                     const char *value[], int length);

/// KEY_NOT_FOUND when there is no such key.
int app_control_remove_extra_data(app_control_h app_control, const char *key);

/// A copy for free(). KEY_NOT_FOUND; INVALID_DATA_TYPE when the key holds an array.
int app_control_get_extra_data(app_control_h app_control, const char *key, char **value);

/// A fresh array: the caller frees each text, then the array. KEY_NOT_FOUND; INVALID_DATA_TYPE when
/// the key holds a single text.
int app_control_get_extra_data_array(app_control_h app_control, const char *key, char ***value,
                                     int *length);

int app_control_is_extra_data_array(app_control_h app_control, const char *key, bool *array);

/// Starts the application named by the app id, or hands the request to its running instance, and
/// returns once the launcher accepted it. APP_NOT_FOUND when no such application is installed, or
/// when the request names none. The reply arrives later on the main loop; with a null callback none
/// is kept. A callee that ends without an answer gives CANCELED.
int app_control_send_launch_request(app_control_h app_control, app_control_reply_cb callback,
                                    void *user_data);

/// Answers a received request, once: a second answer, or a handle that was not received, is
/// INVALID_PARAMETER. Answering a request whose sender wants no reply succeeds.
int app_control_reply_to_launch_request(app_control_h reply, app_control_h request,
                                        app_control_result_e result);

#ifdef __cplusplus
}
#endif
