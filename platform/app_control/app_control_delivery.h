// Launch requests from programs that end when their request has arrived. One that ended after
// app_control_send_launch_request() could end before the request is on its way, or before an
// application that is just leaving has given it back.
#pragma once

#include "app_control.h"

#ifdef __cplusplus
extern "C" {
#endif

/// Sends a request and waits until the application has dealt with it. Main thread, without a
/// running loop: it turns GLib's default main context. The errors of
/// app_control_send_launch_request(); LAUNCH_FAILED also when the application ended before it took
/// the request.
int app_control_deliver_launch_request(app_control_h app_control);

/// Main loop. `result` is APP_CONTROL_ERROR_NONE, or LAUNCH_FAILED when the application ended
/// before it took the request.
typedef void (*app_control_delivered_cb)(int result, void *user_data);

/// The same for a program with a running loop: returns as app_control_send_launch_request() does.
/// After success the callback is called once, when the application has dealt with the request.
int app_control_send_for_delivery(app_control_h app_control, app_control_delivered_cb callback,
                                  void *user_data);

#ifdef __cplusplus
}
#endif
