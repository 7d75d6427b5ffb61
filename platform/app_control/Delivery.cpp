#include "app_control_delivery.h"

#include "Guard.h"
#include "LaunchBus.h"
#include "Launcher.h"

#include <dlog.h>

using namespace pelliko::platform;

namespace
{

int resultOf(const LaunchOutcome &outcome)
{
    if (outcome.error.empty())
        return APP_CONTROL_ERROR_NONE;
    dlog_print(DLOG_ERROR, "APP_CONTROL", "a request was lost: %s", outcome.error.c_str());
    return APP_CONTROL_ERROR_LAUNCH_FAILED;
}

int deliver(app_control_h request)
{
    // A bus that goes away is an error like any other, not the end of this process.
    if (GDBusConnection *bus = sessionBus(nullptr))
        g_dbus_connection_set_exit_on_close(bus, FALSE);
    bool settled = false;
    int result = APP_CONTROL_ERROR_NONE;
    const int code = launch(request, false, [&](const LaunchOutcome &outcome) {
        settled = true;
        result = resultOf(outcome);
    });
    if (code != APP_CONTROL_ERROR_NONE)
        return code;
    while (!settled)
        g_main_context_iteration(nullptr, TRUE);
    return result;
}

} // namespace

int app_control_deliver_launch_request(app_control_h app_control)
{
    return guarded([=] { return deliver(app_control); });
}

int app_control_send_for_delivery(app_control_h app_control, app_control_delivered_cb callback,
                                  void *user_data)
{
    if (!callback)
        return APP_CONTROL_ERROR_INVALID_PARAMETER;
    return guarded([=] {
        return launch(app_control, false, [=](const LaunchOutcome &outcome) {
            callback(resultOf(outcome), user_data);
        });
    });
}
