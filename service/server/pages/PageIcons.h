#pragma once

#include "pages/FileKind.h"

#include <string>

namespace pelliko::server
{

/// A mark beside words that say the same: assistive programs pass it over.
enum class Mark { download, clock, takenBack, question, trouble };

/// The drawing as an element for the inside of a page; it takes the colour of the text around it.
[[nodiscard]] std::string iconOf(FileKind kind);
[[nodiscard]] std::string iconOf(Mark mark);

/// The application's own icon as an element, and as an address for the browser's tab.
[[nodiscard]] const std::string &brandMark();
[[nodiscard]] const std::string &brandAddress();

} // namespace pelliko::server
