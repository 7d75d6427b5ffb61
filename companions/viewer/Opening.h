// Which share a launch request wants to see.
#pragma once

#include <app_control.h>

#include <string>

namespace pelliko::viewer
{

/// The token of the share; empty when the request names none.
std::string tokenOf(app_control_h request);

/// Whether a text can be the token of a share at all: 1 to 24 letters, digits, "-" and "_".
bool isToken(const std::string &text);

} // namespace pelliko::viewer
