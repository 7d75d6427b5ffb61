// All files are up: the recipients are told, the share is sent, or it failed.
#include "PellikoUploadingDataManager/PressedNotification.h"
#include "UploadNotificationsScene.h"

namespace pelliko::test
{
namespace
{

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

TEST_F(UploadNotifications, NotifyingThatIsShownAlreadyIsKept)
{
    UploadNotiData *node = preparing({"/a"});
    notification_set_text(node->notif, NOTIFICATION_TEXT_TYPE_TITLE, "Telling the recipients…",
                          nullptr, NOTIFICATION_VARIABLE_TYPE_NONE);
    updateUploadNotificationWaitForNoti();
    EXPECT_EQ(log.text(), "Notification already added. returning\n");
    EXPECT_EQ(posted("7")->title, "Preparing to send files…");
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
