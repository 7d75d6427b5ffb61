#pragma once

#include "PellikoDatabaseManager/UploadInfoDatabase.h"
#include "PellikoNotificationManager/UploadNotifications.h"
#include "PellikoUploadManager/UploadStatus.h"
#include "PellikoUploadManager/UsagePreferences.h"
#include "support/AppWorld.h"

#include <app_preference.h>
#include <regex>
#include <string>

namespace pelliko::test
{

// Lines about request 7.
inline const std::string popupNotMeant = "req_id = 7 and g_noti_press_data.upload_request_id = 0\n";
inline const std::string rowDeleted = "Records deleted successfully...\n";
inline const std::string historyAbsent = "request_id = 7, req_id = 7\n"
                                         "History app is NOT running\n";

/// An upload under way about which the service reports.
class UploadStatus : public AppWorld
{
protected:
    // Request 7 as the confirmation leaves it: in the list, in the table, "preparing" posted.
    UploadNotiData *start(int32_t request_id = 7, const char *path = "/a/b.jpg")
    {
        UploadNotiData *node = addNode(request_id, {path}, 2000, "Ann?", "31?");
        writeUploadDataToDb(node);
        shareInHand({path});
        ad->upload_item->request_id = request_id;
        addProgressNotification(0, &node->notif);
        node->upload_status = 2;
        log.restart();
        return node;
    }

    void report(int status, int percent = 0, int error_code = 0, const char *input_param = nullptr,
                int request_id = 7)
    {
        uploadResponseStatusCb(status, input_param, percent, 0, 0, error_code, request_id, ad);
    }

    // What was written since the last call, the start of the period without its value.
    std::string written()
    {
        static const std::regex now("(share_time_last with value = )[0-9.]+");
        std::string text = std::regex_replace(log.text(), now, "$1now");
        log.restart();
        return text;
    }

    static bool inList(int32_t request_id)
    {
        for (const UploadNotiData *node = g_upload_noti_data_list; node; node = node->next) {
            if (node->request_id == request_id)
                return true;
        }
        return false;
    }

    static int totalSize()
    {
        int total = 0;
        preference_get_int(shareTotalSizeKey, &total);
        return total;
    }
};

} // namespace pelliko::test
