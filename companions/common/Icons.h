// Pictures of kinds of files from the desktop's icon themes.
#pragma once

#include <string>

namespace pelliko::companion
{

/// The file of a picture such as "image-x-generic", or of the one for any file; empty without an
/// icon theme. The toolkit's own look-up knows only what its background program has indexed.
std::string iconFile(const std::string &name);

} // namespace pelliko::companion
