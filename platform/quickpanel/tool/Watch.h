// Events as they happen.
#pragma once

#include <cstdint>
#include <functional>

#include "Variant.h"

namespace pelliko::quickpanel_tool
{

// Hands over every event with a sequence number above `since` (negative: those from now on), first
// the remembered ones, then each as it happens and each once, until `handle` returns false. Throws
// std::runtime_error when the panel service cannot be reached.
void watch(int64_t since, const std::function<bool(const notification::Variant &event)> &handle);

} // namespace pelliko::quickpanel_tool
