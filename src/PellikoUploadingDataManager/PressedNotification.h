// What the tapped upload notification carried: the upload whose status popup is shown. Main loop
// only.
#pragma once

#include <app_control.h>
#include <cstdint>
#include <string>
#include <vector>

namespace pelliko
{

/// The figures of one upload, as its notification carried them or reports have changed them since.
struct PressedNotification {
    std::string recipient_count; ///< decimal, as received; empty until a notification was tapped
    int32_t upload_status = -1;  ///< NotificationState, -1 when the notification told none
    int32_t total_files = 0;
    int32_t total_size = 0;              ///< bytes
    uint32_t upload_request_id = 0;      ///< 0: none
    std::vector<std::string> recipients; ///< names, "+SMS" after those who are told by SMS
    std::vector<std::string> pictures;   ///< paths in the same order; empty: none
};

extern PressedNotification g_noti_press_data;

/// 1 once the user cancelled the tapped upload: reports that are still under way must not redraw
/// its notification. The status popup sets it and re-arms it for the next one.
extern uint8_t g_cancel_in_progress;

/// Fills g_noti_press_data from the launch request of a tapped notification. A missing figure stays
/// as it was, but for the status, which becomes -1.
void getUploadData(app_control_h request);

/// The number of recipients of the tapped upload, 0 when it is not known.
int32_t pressedRecipientCount();

} // namespace pelliko
