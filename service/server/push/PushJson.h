// Pushes as events of a stream, and what their readers answer
#pragma once

#include "store/Metadata.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace pelliko::server
{

/// A push's id as a text; nothing for what can be none.
[[nodiscard]] std::optional<std::int64_t> parsePushId(std::string_view text);

/// The id up to which pushes are acknowledged; a malformed body is refused.
[[nodiscard]] std::int64_t parseAcknowledged(std::string_view json);

/// The pushes as server-sent events, in their order.
[[nodiscard]] std::string eventsOf(const std::vector<Push> &pushes);

} // namespace pelliko::server
