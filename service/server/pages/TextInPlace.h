#pragma once

#include "store/Metadata.h"

#include <optional>
#include <string>

namespace pelliko::server
{

/// The file of a share that is one text of a length that a page can show, else null.
[[nodiscard]] const FileRecord *textInPlace(const ShareRecord &share);

/// A text's bytes as what a page may show of them: nothing when they are not UTF-8. Marks that say
/// how the bytes are to be read, and characters that no page may hold, are left out.
[[nodiscard]] std::optional<std::string> readableText(const std::string &bytes);

} // namespace pelliko::server
