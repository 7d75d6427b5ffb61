// What stands behind a notification_h.
#pragma once

#include "Record.h"

// Its record's id is the private id under which the notification was last posted or loaded.
struct _notification {
    pelliko::notification::Record record;
};
