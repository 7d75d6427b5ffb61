#include "PellikoApp/AppData.h"

#include <mutex>

namespace pelliko
{

uint8_t is_noti_pressed = 0;
uint8_t popup_update_enabled = 0;
int32_t unsupported_file_count = 0;

namespace
{

// Never destroyed: a detached worker may still read the record when the process ends.
PellikoAppData *g_app_data = nullptr;

// Makes the record before main() runs, when there is one thread only: that is what makes the
// accessor safe afterwards.
[[maybe_unused]] const PellikoAppData *const g_created_at_load = getAppData();

} // namespace

PellikoAppData::~PellikoAppData()
{
    freeUploadData(upload_item);
}

PellikoAppData *getAppData()
{
    // Null only while the program's static objects are being made.
    if (!g_app_data) {
        std::mutex creation;
        const std::lock_guard lock(creation);
        if (!g_app_data)
            g_app_data = new PellikoAppData;
    }
    return g_app_data;
}

} // namespace pelliko
