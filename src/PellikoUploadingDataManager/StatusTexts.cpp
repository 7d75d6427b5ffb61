#include "PellikoUploadingDataManager/StatusTexts.h"

#include "PellikoApp/TextFormat.h"
#include "PellikoUploadingDataManager/PressedNotification.h"

#include <cstdio>
#include <iterator>

namespace pelliko
{

namespace
{

// By state; 7 is nothing that a notification shows.
constexpr const char *ids[] = {
    "IDS_RSH_TMBODY_PREPARING_TO_SEND_FILES_ING_ABB",
    "IDS_RSH_MBODY_SENDING_PAUSED",
    "IDS_RSH_MBODY_SENDING_PAUSED",
    "IDS_RSH_TMBODY_SENDING_ING_ABB",
    "IDS_RSH_BODY_SENDING_THE_FILE_HAS_BEEN_CANCELLED",
    "IDS_RSH_BODY_SENDING_NOTIFICATIONS_TO_RECIPIENTS_ING_M_STATUS_ABB",
    "IDS_NFC_BODY_FILES_SENT_ABB2",
    nullptr,
    "IDS_RSH_POP_A_SERVER_ERROR_HAS_OCCURRED_WHILE_SENDING_FILES",
    "IDS_RSH_POP_SOME_FILES_HAVE_BEEN_MOVED_DELETED_OR_RENAMED_WHILE_BEING_SENT",
};

constexpr const char *units[] = {"B", "KB", "MB", "GB"};

} // namespace

const char *statusLineId(int state)
{
    return state >= 0 && state < static_cast<int>(std::size(ids)) ? ids[state] : nullptr;
}

bool writeSizeLine(char *line)
{
    const PressedNotification &data = g_noti_press_data;
    if (data.total_size <= 0)
        return false;
    double size = data.total_size;
    size_t divisions = 0;
    while (size >= 1024.0) {
        size /= 1024.0;
        ++divisions;
    }
    const char *unit = divisions < std::size(units) ? units[divisions] : "";
    char number[64];
    snprintf(number, sizeof(number), "%.2f", size);
    if (data.total_files == 1)
        formatTranslated(line, sizeLineSize, translated("IDS_RSH_SBODY_1_FILE_HP1SS_P2SS_ABB"),
                         "ss", number, unit);
    else
        formatTranslated(line, sizeLineSize, translated("IDS_RSH_SBODY_P1SD_FILES_HP2SS_P3SS_ABB"),
                         "dss", data.total_files, number, unit);
    return true;
}

} // namespace pelliko
