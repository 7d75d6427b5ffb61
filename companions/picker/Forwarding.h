// Passing a launch request on.
#pragma once

#include <app_control.h>

#include <cstdint>
#include <vector>

namespace pelliko::picker
{

/// Sends the application the same request with these recipients, and returns when it has taken it.
/// Main loop only.
/// @param numberIds of the contacts store; 1 to Choice::most
/// @return 0, or an error of the platform
int shareWith(app_control_h request, const std::vector<int32_t> &numberIds);

/// Answers a sender that waits.
void answer(app_control_h request, app_control_result_e result);

} // namespace pelliko::picker
