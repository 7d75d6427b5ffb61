#pragma once

#include <string>
#include <string_view>

namespace pelliko::server
{

/// 128 bits from the kernel's random source as 22 characters that fit an address.
[[nodiscard]] std::string randomToken();

/// SHA-256, 32 raw bytes. What a link or an account is known by is kept only in this form.
[[nodiscard]] std::string sha256(std::string_view bytes);

/// True for texts that randomToken could have made; anything else needs no look-up.
[[nodiscard]] bool looksLikeToken(std::string_view text);

} // namespace pelliko::server
