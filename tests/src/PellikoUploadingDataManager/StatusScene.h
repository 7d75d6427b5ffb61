#pragma once

#include "PellikoApp/Operation.h"
#include "PellikoNotificationManager/NotificationPrimitives.h"
#include "PellikoUploadingDataManager/PressedNotification.h"
#include "support/LaunchRequest.h"
#include "support/PopupScene.h"

#include <string>
#include <vector>

namespace pelliko::test
{

/// The figures of a notification that somebody taps.
struct Tapped {
    int state = NOTI_STATE_SENDING;
    std::vector<std::string> recipients = {"Ann Example+SMS"};
    int files = 3;
    int bytes = 5 << 20;
    int request_id = 7;
};

/// The popup of a tapped notification on the private display.
class StatusScene : public PopupScene
{
protected:
    StatusScene() { forget(); }
    ~StatusScene() override
    {
        if (ad->popup)
            evas_object_del(ad->popup);
        forget();
    }

    static void writeExtras(LaunchRequest &request, const Tapped &tapped)
    {
        std::string names, ids;
        for (const std::string &recipient : tapped.recipients) {
            names += recipient + "?";
            ids += "999?"; // nobody: the default picture
        }
        request.text("recipient_count", std::to_string(tapped.recipients.size()))
            .text("recipient_index_list", ids)
            .text("recipient_list", names)
            .text("total_files", std::to_string(tapped.files))
            .text("upload_status", std::to_string(tapped.state))
            .text("upload_request_id", std::to_string(tapped.request_id))
            .text("total_size", std::to_string(tapped.bytes));
    }

    /// What the launch of a tapped notification does; the popup stands still, as a person meets it.
    void tap(const Tapped &tapped)
    {
        launch(tapped);
        ASSERT_TRUE(settle(okButton()));
    }

    /// The same, while the popup still slides in: nobody presses it or looks at its place.
    void launch(const Tapped &tapped)
    {
        LaunchRequest request;
        writeExtras(request, tapped);
        ensureMainWindow(app.get(), ad);
        ad->operation_type = OPERATION_UPLOADING_NOTI_PRESSED;
        is_noti_pressed = 1;
        getUploadData(request);
        doOperation(ad);
    }

    /// An upload that the service has accepted.
    UploadNotiData *pending(float progress_percent = 0, int request_id = 7)
    {
        UploadNotiData *node = addUploadNotiDataNode();
        node->request_id = request_id;
        node->progress_percent = progress_percent;
        return node;
    }

    Evas_Object *okButton() const
    {
        return elm_object_part_content_get(button("button1"), "ok_button");
    }

    static void forget()
    {
        g_noti_press_data = {};
        g_cancel_in_progress = 0;
        popup_update_enabled = 0;
        is_noti_pressed = 0;
    }
};

} // namespace pelliko::test
