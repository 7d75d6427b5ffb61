#include "PellikoUploadingDataManager/PressedNotification.h"

namespace pelliko
{

PressedNotification g_noti_press_data;
uint8_t g_cancel_in_progress = 0;

} // namespace pelliko
