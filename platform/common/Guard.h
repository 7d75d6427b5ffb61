// Keeps exceptions on the C++ side of a C interface.
#pragma once

#include "tizen_error.h"

#include <cstring>
#include <new>
#include <string>

namespace pelliko::platform
{

/// The result of `body`, or OUT_OF_MEMORY when an allocation in it failed.
template <typename Body> int guarded(Body body) noexcept
{
    try {
        return body();
    } catch (const std::bad_alloc &) {
        return TIZEN_ERROR_OUT_OF_MEMORY;
    }
}

/// A copy from malloc, as callers of the platform's C interfaces release texts with free().
inline char *mallocedCopy(const std::string &text)
{
    char *copy = strdup(text.c_str());
    if (!copy)
        throw std::bad_alloc();
    return copy;
}

} // namespace pelliko::platform
