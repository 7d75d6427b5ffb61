// From preparing over sending to a pause.
#include "PellikoUploadingDataManager/PressedNotification.h"
#include "UploadNotificationsScene.h"

#include <pelliko_client.h>

namespace pelliko::test
{
namespace
{

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
    log.restart();
    EXPECT_EQ(progress(node, 2), 0);
    EXPECT_TRUE(log.text().starts_with("notification get text error = ")) << log.text();
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

TEST_F(UploadNotifications, PauseThatCannotBeShownLeavesNoHandle)
{
    UploadNotiData *node = preparing({"/a"});
    g_upload_noti_data_list = nullptr; // the upload is no longer in the list
    addPausedNotification(node, PELLIKO_UPLOAD_STATUS_PAUSED);
    g_upload_noti_data_list = node;
    EXPECT_EQ(node->notif, nullptr);
    EXPECT_FALSE(posted("7"));
    EXPECT_EQ(log.messages().back(), "Failure Case...:");
    EXPECT_TRUE(log.has("_notificationInsert failed [-22]")) << log.text();
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

} // namespace
} // namespace pelliko::test
