// What a launch request carries.
#pragma once

#include <app_control.h>

#include <cstdint>
#include <string>
#include <vector>

namespace pelliko::companion
{

/// Empty where the request has none.
std::string operationOf(app_control_h request);
std::string uriOf(app_control_h request);
std::string mimeOf(app_control_h request);
std::string extraOf(app_control_h request, const char *key);
std::vector<std::string> extrasOf(app_control_h request, const char *key);

/// A record's id, which is more than 0; 0 for every text that is none.
int32_t idOf(const std::string &text);

} // namespace pelliko::companion
