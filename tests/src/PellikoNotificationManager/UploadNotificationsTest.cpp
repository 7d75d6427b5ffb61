#include "PellikoNotificationManager/UploadNotifications.h"
#include "PellikoNotificationManager/NotificationPrimitives.h"
#include "PellikoUploadingDataManager/PressedNotification.h"
#include "support/AppWorld.h"
#include "support/Catalogue.h"

#include <pelliko_client.h>

namespace pelliko::test
{
namespace
{

constexpr const char *panelPicture =
    "/usr/apps/com.velmora.quickpanel/shared/res/noti_icons/Common/noti_upload_complete.png";
constexpr const char *indicatorPicture =
    "/usr/apps/com.velmora.indicator/res/icons/Processing/b03_processing_upload_complete.png";

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

TEST_F(UploadNotifications, PreparingShowsItsRowAndItsTicker)
{
    UploadNotiData *node = preparing({"/a"});
    EXPECT_NE(node->notif, nullptr);
    const auto shown = posted("7");
    ASSERT_TRUE(shown);
    EXPECT_EQ(shown->type, NOTIFICATION_TYPE_ONGOING);
    EXPECT_EQ(shown->layout, NOTIFICATION_LY_ONGOING_EVENT);
    EXPECT_EQ(shown->display, 1);
    EXPECT_EQ(shown->title, "Preparing to send files…");
    EXPECT_EQ(shown->content, "Waiting…");
    EXPECT_EQ(shown->icon, panelPicture);
    EXPECT_EQ(shown->indicator_icon, indicatorPicture);
    EXPECT_EQ(shown->app_id, "com.velmora.pelliko");
    EXPECT_EQ(shown->operation, "http://tizen.org/appcontrol/operation/uploading_noti_pressed");
    EXPECT_EQ(shown->extras.at("upload_status"), "0");
    EXPECT_EQ(shown->extras.at("upload_request_id"), "7");
}

TEST_F(UploadNotifications, PreparingWritesItsLines)
{
    g_current_node = addNode(7, {"/a"}, 2000, "Ann?", "31?");
    shareInHand({"/a"});
    ad->upload_item->request_id = 7;
    ad->upload_item->files_size = 2000;
    log.restart();
    addProgressNotification(0, &g_current_node->notif);
    EXPECT_EQ(log.text(), "Adding new notification with title = <Preparing to upload>\n"
                          "Populating extra data from ad_upload_item...\n"
                          "Adding total recipients = 1\n"
                          "Adding recipient index list to extra data. list = 31?\n"
                          "Adding recipient list to extra data. list = Ann?\n"
                          "Adding total files = 1\n"
                          "Adding status = 0\n"
                          "Adding request id = 7\n"
                          "Adding total size = 2000\n"
                          "Populating tag from ad_upload_item...\n"
                          "Request id found = 7\n"
                          "node->noti_priv_id = 7\n"
                          "_notificationInsert success\n");
}

TEST_F(UploadNotifications, AnotherKindHasNoTextsAndKindThreeNoLaunchRequest)
{
    g_current_node = addNode(7, {"/a"}, 2000, "Ann?", "31?");
    ad->is_resume_by_reboot = 1;
    ad->has_upload_resume = 1;
    addProgressNotification(1, &g_current_node->notif);
    ASSERT_TRUE(posted("7"));
    EXPECT_EQ(posted("7")->title, "");
    EXPECT_EQ(posted("7")->app_id, "com.velmora.pelliko");
    addProgressNotification(3, &g_current_node->notif);
    ASSERT_TRUE(posted("7"));
    EXPECT_EQ(posted("7")->app_id, "");
}

TEST_F(UploadNotifications, TheFirstProgressReplacesPreparingAndSetsTheBar)
{
    UploadNotiData *node = preparing({"/a", "/b", "/c"});
    EXPECT_EQ(progress(node, 40), 1);
    const auto shown = posted("7");
    ASSERT_TRUE(shown);
    EXPECT_EQ(shown->type, NOTIFICATION_TYPE_ONGOING);
    EXPECT_EQ(shown->layout, NOTIFICATION_LY_ONGOING_PROGRESS);
    EXPECT_EQ(shown->display, 9);
    EXPECT_EQ(shown->title, "Sending 3 files…");
    EXPECT_EQ(shown->icon, "reserved://quickpanel/ani/uploading");
    EXPECT_EQ(shown->indicator_icon, "reserved://indicator/ani/uploading");
    EXPECT_EQ(shown->extras.at("upload_status"), "3");
    EXPECT_DOUBLE_EQ(shown->progress, 0.4);
}

TEST_F(UploadNotifications, TheFirstProgressWritesItsLines)
{
    UploadNotiData *node = preparing({"/a"});
    progress(node, 40);
    std::string absent;
    for (int i = 0; i < 6; ++i)
        absent += "app control error recieved = -126\n";
    EXPECT_EQ(log.text(), "Uploading stage is preparing or paused\n"
                          "noti_id = 7\n"
                          "************* Removing Noti = 7*******************\n"
                          "Adding sending noti...\n" +
                              absent +
                              "Populating extra data from current node...\n"
                              "Adding total recipients = 1\n"
                              "Adding recipient index list to extra data. list = 31?\n"
                              "Adding recipient list to extra data. list = Ann?\n"
                              "Adding total files = 1\n"
                              "Adding status = 3\n"
                              "Adding request id = 7\n"
                              "Adding total size = 5000\n"
                              "Populating tag from current node...\n"
                              "Request id found = 7\n"
                              "node->noti_priv_id = 7\n"
                              "progress_percent = 40\n"
                              "Updating progress on notification = 7 with percent = 0.400000\n");
}

TEST_F(UploadNotifications, LaterProgressOnlyMovesTheBar)
{
    UploadNotiData *node = preparing({"/a"});
    progress(node, 40);
    log.restart();
    EXPECT_EQ(progress(node, 55), 1);
    EXPECT_EQ(log.text(), "progress_percent = 55\n"
                          "Updating progress on notification = 7 with percent = 0.550000\n");
    EXPECT_DOUBLE_EQ(posted("7")->progress, 0.55);
}

TEST_F(UploadNotifications, AHundredPercentLeavesTheBarWhereItWas)
{
    UploadNotiData *node = preparing({"/a"});
    progress(node, 99);
    log.restart();
    EXPECT_EQ(progress(node, 100), 1);
    EXPECT_EQ(log.text(), "progress_percent = 100\n");
    EXPECT_DOUBLE_EQ(posted("7")->progress, 0.99);
}

TEST_F(UploadNotifications, OneFileHasItsOwnTitle)
{
    progress(preparing({"/a"}), 1);
    EXPECT_EQ(posted("7")->title, "Sending 1 file…");
}

TEST_F(UploadNotifications, NoFilesNoTitle)
{
    UploadNotiData *node = preparing({});
    EXPECT_EQ(progress(node, 1), 1);
    EXPECT_EQ(posted("7")->title, "");
    EXPECT_EQ(progress(node, 2), 0);
}

TEST_F(UploadNotifications, WithoutAHandleNothingIsSent)
{
    g_current_node = addNode(7, {"/a"}, 2000, "Ann?", "31?");
    EXPECT_EQ(progress(g_current_node, 5), 0);
    EXPECT_FALSE(posted("7"));
    EXPECT_EQ(log.text(), "");
}

TEST_F(UploadNotifications, ACancelUnderWayStopsTheBar)
{
    UploadNotiData *node = preparing({"/a"});
    progress(node, 40);
    g_cancel_in_progress = 1;
    log.restart();
    EXPECT_EQ(progress(node, 60), 0);
    EXPECT_EQ(log.text(), "");
    EXPECT_DOUBLE_EQ(posted("7")->progress, 0.4);
}

TEST_F(UploadNotifications, ANotificationThatWasSwipedAwayIsNotShownAgainByProgress)
{
    UploadNotiData *node = preparing({"/a"});
    progress(node, 40);
    notification_delete_all(NOTIFICATION_TYPE_ONGOING);
    EXPECT_EQ(progress(node, 60), 1);
    EXPECT_FALSE(posted("7"));
}

TEST_F(UploadNotifications, ATranslationThatDoesNotTakeACountIsShownAsItStands)
{
    const Catalogue odd({{"IDS_RSH_MBODY_SENDING_PD_FILES_ING", "%s %s %n"}});
    g_current_node = addNode(7, {"/a", "/b"}, 2000, "Ann?", "31?");
    ad->is_resume_by_reboot = 1;
    ad->has_upload_resume = 1;
    addProgressNotification(0, &g_current_node->notif);
    progress(g_current_node, 1);
    EXPECT_EQ(posted("7")->title, "%s %s %n");
}

TEST_F(UploadNotifications, PausingReplacesTheNotification)
{
    UploadNotiData *node = preparing({"/a"});
    progress(node, 40);
    log.restart();
    addPausedNotification(node, PELLIKO_UPLOAD_STATUS_PAUSED);
    const auto shown = posted("7");
    ASSERT_TRUE(shown);
    EXPECT_EQ(shown->type, NOTIFICATION_TYPE_ONGOING);
    EXPECT_EQ(shown->layout, NOTIFICATION_LY_ONGOING_EVENT);
    EXPECT_EQ(shown->title, "Sending paused.");
    EXPECT_EQ(shown->content, "Waiting…");
    EXPECT_EQ(shown->icon, panelPicture);
    EXPECT_EQ(shown->extras.at("upload_status"), "1");
    EXPECT_TRUE(log.has("Updating notification with text <Uploading Paused>"));
    EXPECT_TRUE(log.has("_notificationInsert success"));
}

TEST_F(UploadNotifications, PausingWhilePreparingShowsPaused)
{
    UploadNotiData *node = preparing({"/a"});
    addPausedNotification(node, PELLIKO_UPLOAD_STATUS_PAUSED);
    EXPECT_EQ(posted("7")->title, "Sending paused.");
}

TEST_F(UploadNotifications, PausingTwiceShowsOnePausedNotification)
{
    UploadNotiData *node = preparing({"/a"});
    addPausedNotification(node, PELLIKO_UPLOAD_STATUS_PAUSED);
    const notification_h first = node->notif;
    log.restart();
    addPausedNotification(node, PELLIKO_UPLOAD_STATUS_PAUSED);
    EXPECT_EQ(log.text(), "Already Paused.. returning\n");
    EXPECT_EQ(node->notif, first);
}

TEST_F(UploadNotifications, OnlyTheStatusPausedPauses)
{
    UploadNotiData *node = preparing({"/a"});
    addPausedNotification(node, PELLIKO_UPLOAD_STATUS_PROGRESSING);
    EXPECT_EQ(posted("7")->title, "Preparing to send files…");
}

TEST_F(UploadNotifications, PausingWhatTheUserSwipedAwayDoesNotBringItBack)
{
    UploadNotiData *node = preparing({"/a"});
    notification_delete_all(NOTIFICATION_TYPE_ONGOING);
    addPausedNotification(node, PELLIKO_UPLOAD_STATUS_PAUSED);
    EXPECT_TRUE(log.has("Already preparing to upload.. returning")) << log.text();
    EXPECT_FALSE(posted("7"));
}

TEST_F(UploadNotifications, ProgressAfterAPauseShowsSendingAgain)
{
    UploadNotiData *node = preparing({"/a"});
    addPausedNotification(node, PELLIKO_UPLOAD_STATUS_PAUSED);
    EXPECT_EQ(progress(node, 50), 1);
    EXPECT_EQ(posted("7")->title, "Sending 1 file…");
}

TEST_F(UploadNotifications, AnOldTitleIsNotRecognisedAfterALanguageChange)
{
    UploadNotiData *node = preparing({"/a"});
    const Catalogue german({{"IDS_RSH_TMBODY_PREPARING_TO_SEND_FILES_ING_ABB", "Vorbereiten…"},
                            {"IDS_RSH_MBODY_SENDING_PAUSED", "Angehalten."}});
    EXPECT_EQ(progress(node, 50), 1);
    EXPECT_EQ(posted("7")->title, "Preparing to send files…");
    EXPECT_DOUBLE_EQ(posted("7")->progress, 0.5);
}

TEST_F(UploadNotifications, NotifyingIsShownAndItsHandleNotKept)
{
    UploadNotiData *node = preparing({"/a"});
    deleteNotificationById(&node->notif, node->noti_priv_id);
    log.restart();
    updateUploadNotificationWaitForNoti();
    EXPECT_EQ(node->notif, nullptr);
    const auto shown = posted("7");
    ASSERT_TRUE(shown);
    EXPECT_EQ(shown->type, NOTIFICATION_TYPE_ONGOING);
    EXPECT_EQ(shown->layout, NOTIFICATION_LY_ONGOING_EVENT);
    EXPECT_EQ(shown->display, 1);
    EXPECT_EQ(shown->title, "Telling the recipients…");
    EXPECT_EQ(shown->content, "");
    EXPECT_EQ(shown->extras.at("upload_status"), "5");
    EXPECT_TRUE(
        log.has("Updating notification with text <Sending notifications to recipients...>"));
}

TEST_F(UploadNotifications, NotifyingIsNotShownForACancelledTappedUpload)
{
    UploadNotiData *node = preparing({"/a"});
    deleteNotificationById(&node->notif, node->noti_priv_id);
    for (const int state : {7, 4}) {
        g_noti_press_data.upload_status = state;
        updateUploadNotificationWaitForNoti();
        EXPECT_FALSE(posted("7")) << state;
    }
}

TEST_F(UploadNotifications, SentReplacesNotifyingByItsTag)
{
    UploadNotiData *node = preparing({"/a", "/b"});
    deleteNotificationById(&node->notif, node->noti_priv_id);
    updateUploadNotificationWaitForNoti();
    log.restart();
    updateUploadNotificationSent(2);
    const auto shown = posted("7");
    ASSERT_TRUE(shown);
    EXPECT_EQ(shown->type, NOTIFICATION_TYPE_NOTI);
    EXPECT_EQ(shown->layout, NOTIFICATION_LY_NOTI_EVENT_MULTIPLE);
    EXPECT_EQ(shown->display, 1);
    EXPECT_EQ(shown->title, "Files sent.");
    EXPECT_EQ(shown->content, "2 succeeded");
    EXPECT_EQ(shown->icon, panelPicture);
    EXPECT_EQ(shown->indicator_icon, indicatorPicture);
    EXPECT_EQ(shown->extras.at("upload_status"), "6");
    EXPECT_EQ(log.messages()[0], "noti_id = 7");
    EXPECT_EQ(log.messages()[1], "Notification is null, returning");
    EXPECT_EQ(log.messages()[2], "Upload Complete. Updating notification");
}

TEST_F(UploadNotifications, SentEndsTheResumeAfterAReboot)
{
    preparing({"/a"});
    ASSERT_EQ(ad->is_resume_by_reboot, 1);
    updateUploadNotificationSent(1);
    EXPECT_EQ(ad->is_resume_by_reboot, 0);
    EXPECT_EQ(ad->has_upload_resume, 0);
}

TEST_F(UploadNotifications, ServerErrorsAreThreeCodes)
{
    for (const int code : {-16, -7, -4})
        EXPECT_TRUE(_isServerError(code)) << code;
    for (const int code : {-18, -5, 1, 0, 4, 7, 16})
        EXPECT_FALSE(_isServerError(code)) << code;
}

TEST_F(UploadNotifications, AFailureTellsWhoseItWas)
{
    const struct {
        int code;
        const char *text;
        const char *state;
    } cases[] = {{-16, "Server error.", "8"}, {-7, "Server error.", "8"},
                 {-4, "Server error.", "8"},  {-18, "Device error.", "9"},
                 {-5, "Device error.", "9"},  {1, "Device error.", "9"}};
    UploadNotiData *node = preparing({"/a"});
    for (const auto &one : cases) {
        uploadAddFailedNotification(ad, 2, one.code);
        const auto shown = posted("7");
        ASSERT_TRUE(shown) << one.code;
        EXPECT_EQ(shown->type, NOTIFICATION_TYPE_NOTI);
        EXPECT_EQ(shown->layout, NOTIFICATION_LY_NOTI_EVENT_MULTIPLE);
        EXPECT_EQ(shown->title, "Failed to send files.");
        EXPECT_EQ(shown->content, one.text) << one.code;
        EXPECT_EQ(shown->extras.at("upload_status"), one.state) << one.code;
        EXPECT_EQ(node->notif, nullptr);
    }
}

TEST_F(UploadNotifications, AFailureWritesItsLines)
{
    preparing({"/a"});
    uploadAddFailedNotification(ad, 2, -16);
    EXPECT_EQ(log.text(), "Remote Share Upload error err - -16\n\n"
                          "noti_id = 7\n"
                          "************* Removing Noti = 7*******************\n"
                          "Updating notification with text <Failed to send files.>\n"
                          "Populating extra data from current node...\n"
                          "Adding total recipients = 1\n"
                          "Adding recipient index list to extra data. list = 31?\n"
                          "Adding recipient list to extra data. list = Ann?\n"
                          "Adding total files = 1\n"
                          "Adding status = 8\n"
                          "Adding request id = 7\n"
                          "Adding total size = 5000\n"
                          "Populating tag from current node...\n"
                          "Request id found = 7\n"
                          "node->noti_priv_id = 7\n");
}

TEST_F(UploadNotifications, ErrorZeroOnlyTakesTheNotificationAway)
{
    preparing({"/a"});
    uploadAddFailedNotification(ad, 2, 0);
    EXPECT_FALSE(posted("7"));
}

} // namespace
} // namespace pelliko::test
