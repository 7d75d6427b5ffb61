// Calls to the panel service, which the bus starts when it is not running.
#pragma once

#include "Variant.h"

namespace pelliko::notification
{

struct Reply {
    int error = 0; // 0, or the notification error number for a call that did not get through
    Variant value; // the tuple of results
};

// Blocks until the service has answered; needs no main loop. parameters may be floating; reply_type
// is the type of the result tuple. Any thread.
Reply callPanel(const char *method, GVariant *parameters, const char *reply_type);

} // namespace pelliko::notification
