// One line of the panel's history.
#pragma once

#include <cstdint>
#include <string>

#include "Record.h"

namespace pelliko::quickpanel
{

using notification::Record;
using notification::Variant;

struct Event {
    int64_t sequence = 0; // ever growing, given by the store
    int64_t at = 0;       // microseconds since the epoch, given by the store
    std::string name;     // post, ticker, update, delete, tap, swipe, toast
    Record record;        // the notification; of a toast the application only
    int64_t replaced = 0; // the private id that a post replaced
    std::string message;  // of a toast
};

// The form described in dbus/com.velmora.Platform.Panel1.xml.
Variant toVariant(const Event &event);

} // namespace pelliko::quickpanel
