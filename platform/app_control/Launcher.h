// Takes launch requests to the application that they name.
#pragma once

#include "app_control.h"

#include <functional>
#include <string>

namespace pelliko::platform
{

/// How a launch ended. `reply` holds the callee's extra data, empty when there is none, and is the
/// launcher's. `error` says why nobody answered; empty when the callee did.
struct LaunchOutcome {
    app_control_h request;
    app_control_h reply;
    app_control_result_e result;
    std::string error;
};
using LaunchCallback = std::function<void(const LaunchOutcome &)>;

/// Sends a copy of the request and returns once the launcher accepted it: an app_control_error_e.
/// After success `done` is called once on the thread's main context: with the callee's answer when
/// `replyWanted`, else when the callee has dealt with the request. Never called after an error.
int launch(app_control_h request, bool replyWanted, LaunchCallback done);

/// What a hand-over to a running instance came to.
enum class HandOver { Done, NobodyThere, Failed };

/// Gives a request to the running instance of its application and waits until that has dealt with
/// it. Starts nothing. `error` gets the reason of a failure.
HandOver handOver(app_control_h request, std::string *error);

} // namespace pelliko::platform
