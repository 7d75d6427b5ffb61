#pragma once

#include "http/Message.h"

#include <cstdint>
#include <map>
#include <string>
#include <string_view>

namespace pelliko::server
{

inline constexpr const char *tusVersion = "1.0.0";

/// Refuses a request that does not speak this version of the protocol.
void checkTusVersion(const Request &request);

/// The method meant: X-HTTP-Method-Override replaces that of clients that cannot send PATCH.
[[nodiscard]] std::string tusMethod(const Request &request);

/// A header's non-negative decimal number; absent or malformed is refused.
[[nodiscard]] std::uint64_t requiredNumber(const Request &request, const char *name);

/// Reads a whole non-negative decimal number; nothing for anything else.
[[nodiscard]] std::optional<std::uint64_t> parseNumber(std::string_view text);

/// Upload-Metadata as keys and decoded values; malformed is refused.
[[nodiscard]] std::map<std::string, std::string> parseUploadMetadata(std::string_view value);

/// Refuses a body that is not announced as bytes of an upload.
void checkContentType(const Request &request);

} // namespace pelliko::server
