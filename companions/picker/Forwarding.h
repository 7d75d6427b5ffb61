// Passing a launch request on.
#pragma once

#include <app_control.h>
#include <app_control_delivery.h>

#include <cstdint>
#include <vector>

namespace pelliko::picker
{

/// Sends the application the same request with these recipients. Main loop only.
/// @param numberIds of the contacts store; 1 to Choice::most
/// @param taken called with 0 when the application has dealt with the request, or with an error
/// @return 0, or an error of the platform, after which `taken` is not called
int shareWith(app_control_h request, const std::vector<int32_t> &numberIds,
              app_control_delivered_cb taken, void *data);

/// Answers a sender that waits.
void answer(app_control_h request, app_control_result_e result);

} // namespace pelliko::picker
