#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace pelliko::server
{

/// Reduces a name from outside to one that can be shown and saved: its last component, without
/// control characters and without those that turn the direction of text, at most 255 bytes.
/// Nothing left gives "file". `name` is UTF-8.
[[nodiscard]] std::string cleanFileName(std::string_view name);

/// The MIME type as given when it is well-formed, else the type of unknown bytes.
[[nodiscard]] std::string cleanType(std::string_view type);

/// The names with " (2)", " (3)"… before the extension where one was there before; upper and lower
/// case count as equal, because they do on the systems that unpack.
[[nodiscard]] std::vector<std::string> uniqueNames(const std::vector<std::string> &names);

} // namespace pelliko::server
