// The values of one application on disk.
#pragma once

#include <optional>
#include <string>
#include <variant>

namespace pelliko::preference
{

using Value = std::variant<int, double, std::string, bool>;

/// What a call of the store came to.
enum class Outcome { Done, Absent, Failed };

/// Every function may be called on any thread. Damage and refusals of the disk are `Failed` and
/// logged; the file is opened again by the next call.
Outcome readValue(const std::string &key, std::optional<Value> *value);
/// Done when the value is on stable storage.
Outcome writeValue(const std::string &key, const Value &value);
Outcome removeValue(const std::string &key);
Outcome removeAllValues();

} // namespace pelliko::preference
