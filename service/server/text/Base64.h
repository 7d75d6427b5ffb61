#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace pelliko::server
{

/// Base64 for addresses: '-' and '_' for '+' and '/', no padding.
[[nodiscard]] std::string base64Url(std::string_view bytes);

/// Usual base64 with padding, as for header values.
[[nodiscard]] std::string base64(std::string_view bytes);

/// Reads usual base64, padded; nothing when it is malformed.
[[nodiscard]] std::optional<std::string> base64Decode(std::string_view text);

} // namespace pelliko::server
