#pragma once

#include "PellikoApp/AppData.h"
#include "PellikoApp/CText.h"

#include <WApp.h>

namespace pelliko
{

/// What the dispatcher reads of every request; absent texts are null.
struct Launch {
    app_control_h request; ///< borrowed from the frame
    app_assist::WApp *app; ///< the owner of a window that is still to be made
    CText operation;
    CText mime;
    bool reshare; ///< the request names an earlier upload to share again
};

/// What follows once a request was read.
enum class Next {
    run,   ///< the operation is to be done
    leave, ///< the request could not be understood
    wait,  ///< a worker is at it, and the operation follows it
    quit   ///< the application is ending: there is nothing more to do
};

/// Reads the request into the record as its operation asks; the operation itself is not done here.
/// An operation that nobody knows leaves ad->operation_type as it was, so that the last operation
/// runs again. Main loop only.
Next dispatch(const Launch &launch, PellikoAppData *ad);

} // namespace pelliko
