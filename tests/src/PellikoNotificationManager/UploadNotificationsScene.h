#pragma once

#include "PellikoNotificationManager/NotificationPrimitives.h"
#include "PellikoNotificationManager/UploadNotifications.h"
#include "support/AppWorld.h"
#include "support/Catalogue.h"

#include <string>
#include <vector>

namespace pelliko::test
{

constexpr const char *panelPicture =
    "/usr/apps/com.velmora.quickpanel/shared/res/noti_icons/Common/noti_upload_complete.png";
constexpr const char *indicatorPicture =
    "/usr/apps/com.velmora.indicator/res/icons/Processing/b03_processing_upload_complete.png";

/// An upload and its notification, with short texts.
class UploadNotifications : public AppWorld
{
protected:
    UploadNotifications()
        : texts_({{"IDS_RSH_TMBODY_PREPARING_TO_SEND_FILES_ING_ABB", "Preparing to send files…"},
                  {"IDS_RSH_SBODY_WAITING_FOR_CONNECTION_ING_M_STATUS_ABB", "Waiting…"},
                  {"IDS_RSH_MBODY_SENDING_PD_FILES_ING", "Sending %d files…"},
                  {"IDS_RSH_MBODY_SENDING_1_FILE_ING", "Sending 1 file…"},
                  {"IDS_RSH_MBODY_SENDING_PAUSED", "Sending paused."},
                  {"IDS_RSH_TMBODY_SENDING_ING_ABB", "Sending…"},
                  {"IDS_RSH_BODY_SENDING_NOTIFICATIONS_TO_RECIPIENTS_ING_M_STATUS_ABB",
                   "Telling the recipients…"},
                  {"IDS_BT_SBODY_FILES_SENT_M_STATUS_ABB", "Files sent."},
                  {"IDS_RSH_SBODY_PD_SUCCEEDED_ABB", "%d succeeded"},
                  {"IDS_RSH_TMBODY_FAILED_TO_SEND_FILES_ABB", "Failed to send files."},
                  {"IDS_RSH_SBODY_SERVER_ERROR_OCCURRED_ABB", "Server error."},
                  {"IDS_RSH_SBODY_DEVICE_ERROR_OCCURRED_ABB", "Device error."}})
    {
    }

    // Request 7 as the resume after a reboot shows it: preparing, with its figures in the node.
    UploadNotiData *preparing(const std::vector<std::string> &files)
    {
        g_current_node = addNode(7, files, 5000, "Ann?", "31?");
        ad->is_resume_by_reboot = 1;
        ad->has_upload_resume = 1;
        addProgressNotification(0, &g_current_node->notif);
        log.restart();
        return g_current_node;
    }

    int progress(UploadNotiData *node, int percent)
    {
        return updateUploadNotificationSendingStatus(ad, percent, &node->notif, node->noti_priv_id);
    }

private:
    Catalogue texts_;
};

} // namespace pelliko::test
