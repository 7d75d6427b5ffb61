// The fault plan of the test builds: which call of a platform interface fails, and when.
#pragma once

#include <string>

namespace pelliko::platform
{

/// Replaces the plan and starts counting anew. A plan is a comma list of CALL:N or CALL:N=RESULT:
/// the Nth call of CALL (1 is the next one) does nothing and returns RESULT, or without one what
/// that call returns when it fails (a null pointer, false, an error of its module). An empty plan
/// makes nothing fail. Any thread.
/// @return empty, or one sentence on what is wrong with the plan; the plan before stays then
std::string planFaults(const std::string &plan);

/// Appends a line "CALL N" for every call that is made from now on to a file, and "CALL N failed"
/// when the plan made it fail. An empty name ends it. Any thread.
/// @return empty, or why the file cannot be written
std::string traceCalls(const std::string &file);

} // namespace pelliko::platform
