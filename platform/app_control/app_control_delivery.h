// Launch requests from programs that end when their request has arrived.
#pragma once

#include "app_control.h"

#ifdef __cplusplus
extern "C" {
#endif

/// Sends a request and waits until the application has dealt with it; a program that ended after
/// app_control_send_launch_request() could end before the request is on its way, or before an
/// application that is just leaving has given it back. Main thread, without a running loop: it
/// turns GLib's default main context. The errors of that call; LAUNCH_FAILED also when the
/// application ended before it took the request.
int app_control_deliver_launch_request(app_control_h app_control);

#ifdef __cplusplus
}
#endif
