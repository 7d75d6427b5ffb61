#pragma once

#include <algorithm>
#include <cstdint>
#include <cstdlib>

namespace pelliko
{

/// The decimal number at the start of a text, held at the ends of 32 bits as on a 32-bit target; 0
/// for a null text or one that does not begin with a number.
inline int32_t decimalValue(const char *text)
{
    if (!text)
        return 0;
    const long long value = strtoll(text, nullptr, 10);
    return static_cast<int32_t>(std::clamp<long long>(value, INT32_MIN, INT32_MAX));
}

} // namespace pelliko
