#pragma once

#include <string_view>

namespace pelliko::server
{

/// What a file is to the person who gets it.
enum class FileKind { picture, video, sound, text, contact, document, archive, other };

/// Goes by the end of the name, since that decides what the receiving system opens the file with;
/// only a name without one leaves it to the type, which the sender chose.
[[nodiscard]] FileKind kindOf(std::string_view name, std::string_view type);

/// The English word for a kind, a text of the pages.
[[nodiscard]] const char *wordFor(FileKind kind);

} // namespace pelliko::server
