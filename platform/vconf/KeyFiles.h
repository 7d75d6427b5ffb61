// Configuration keys as files: one small file per key, replaced as a whole.
#pragma once

#include <optional>
#include <string>
#include <variant>

namespace pelliko::vconf
{

using Value = std::variant<bool, int, std::string>;

/// The file of a key; empty when the key is not one that can be kept: it begins with "db/" or
/// "memory/" and no part of it is empty or begins with a dot.
std::string fileOfKey(const std::string &key);

/// What the key holds; nothing when it is absent, unreadable or damaged. Any thread.
std::optional<Value> readKey(const std::string &key);

/// Replaces the key's file in one step. A "db/" key is on stable storage afterwards. Any thread.
[[nodiscard]] bool writeKey(const std::string &key, const Value &value);

} // namespace pelliko::vconf
