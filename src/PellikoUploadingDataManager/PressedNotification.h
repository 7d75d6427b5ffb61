#pragma once

#include <cstdint>

namespace pelliko
{

/// What the tapped upload notification carried: the upload whose status popup is shown. Main loop
/// only.
struct PressedNotification {
    int32_t upload_status = -1;     ///< NotificationState, -1 until a notification was tapped
    uint32_t upload_request_id = 0; ///< 0: none
};

extern PressedNotification g_noti_press_data;

/// 1 once the user cancelled the tapped upload: reports that are still under way must not redraw
/// its notification. The status popup sets it and re-arms it for the next one.
extern uint8_t g_cancel_in_progress;

} // namespace pelliko
