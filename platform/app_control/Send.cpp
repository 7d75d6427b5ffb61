// The two calls of the interface that reach other programs.
#include "Guard.h"
#include "Handle.h"
#include "Launcher.h"
#include "Serialisation.h"

#include <dlog.h>

using namespace pelliko::platform;

namespace
{

void logFailure(const LaunchOutcome &outcome)
{
    if (!outcome.error.empty())
        dlog_print(DLOG_ERROR, "APP_CONTROL", "a request to %s was lost: %s",
                   outcome.request->appId->c_str(), outcome.error.c_str());
}

} // namespace

int app_control_send_launch_request(app_control_h app_control, app_control_reply_cb callback,
                                    void *user_data)
{
    return guarded([=] {
        return launch(app_control, callback != nullptr, [=](const LaunchOutcome &outcome) {
            logFailure(outcome);
            if (callback)
                callback(outcome.request, outcome.reply, outcome.result, user_data);
        });
    });
}

int app_control_reply_to_launch_request(app_control_h reply, app_control_h request,
                                        app_control_result_e result)
{
    if (!reply || !request || !request->token)
        return APP_CONTROL_ERROR_INVALID_PARAMETER;
    return guarded([=] {
        return request->token->answer(result, extrasToVariant(reply))
                   ? APP_CONTROL_ERROR_NONE
                   : APP_CONTROL_ERROR_INVALID_PARAMETER;
    });
}
