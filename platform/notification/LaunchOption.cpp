// The launch request that a tap sends.
#include "Guard.h"
#include "Handle.h"
#include "Serialisation.h"
#include "notification.h"

using pelliko::notification::Variant;
using pelliko::platform::guarded;

extern "C" {

int notification_set_launch_option(notification_h noti, notification_launch_option_type type,
                                   void *option)
{
    if (!noti || !option || type != NOTIFICATION_LAUNCH_OPTION_APP_CONTROL)
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    return guarded([&] {
        noti->record.launch =
            Variant(pelliko::platform::toVariant(static_cast<app_control_h>(option)));
        return NOTIFICATION_ERROR_NONE;
    });
}

int notification_get_launch_option(notification_h noti, notification_launch_option_type type,
                                   void *option)
{
    if (!noti || !option || type != NOTIFICATION_LAUNCH_OPTION_APP_CONTROL)
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    return guarded([&] {
        *static_cast<app_control_h *>(option) =
            pelliko::platform::fromVariant(noti->record.launch.get());
        return NOTIFICATION_ERROR_NONE;
    });
}
}
