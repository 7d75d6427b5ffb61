// From a picture that a notification names to one that a desktop can draw.
#pragma once

#include <string>

namespace pelliko::quickpanel
{

// A path that exists is returned as it is; the panel's own pictures ("reserved:...") and files that
// only a handset has become the themed icon name that says the same. Empty stays empty.
std::string drawableIcon(const std::string &image);

// The same for a picture that the handset's panel animates: a desktop shows one still picture at a
// time, so each report of progress (0 to 100) brings the next of them.
std::string movingIcon(const std::string &image, int percent);

} // namespace pelliko::quickpanel
