// Keeps C++ failures inside the C interface.
#pragma once

#include <new>

#include "notification.h"

namespace pelliko::notification
{

// What can be thrown by the record's containers is a lack of memory.
template <typename Call> int guarded(const Call &call) noexcept
{
    try {
        return call();
    } catch (const std::bad_alloc &) {
        return NOTIFICATION_ERROR_OUT_OF_MEMORY;
    }
}

} // namespace pelliko::notification
