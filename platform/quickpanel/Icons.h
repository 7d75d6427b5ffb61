// From a picture that a notification names to one that a desktop can draw.
#pragma once

#include <string>

namespace pelliko::quickpanel
{

// A path that exists is returned as it is; the panel's own pictures ("reserved:...") and files that
// only a handset has become the themed icon name that says the same. Empty stays empty.
std::string drawableIcon(const std::string &image);

} // namespace pelliko::quickpanel
