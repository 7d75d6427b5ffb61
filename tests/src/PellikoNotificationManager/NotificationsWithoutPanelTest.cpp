#include "PellikoNotificationManager/NotificationBackup.h"
#include "PellikoNotificationManager/NotificationPrimitives.h"
#include "PellikoNotificationManager/ReceivedShareNotifications.h"
#include "PellikoNotificationManager/SenderNames.h"
#include "PellikoNotificationManager/UploadNotifications.h"
#include "platform/quickpanel/support/Bus.h"
#include "support/AppWorld.h"

#include <app_preference.h>
#include <cstdlib>
#include <filesystem>
#include <glib.h>
#include <gmock/gmock.h>

namespace pelliko::test
{
namespace
{

using ::testing::ElementsAre;
using ::testing::MatchesRegex;

constexpr const char *panelName = "com.velmora.quickpanel";

void reloadBusConfiguration()
{
    panel_testing::Connection().call("org.freedesktop.DBus", "/org/freedesktop/DBus",
                                     "org.freedesktop.DBus", "ReloadConfig", nullptr);
}

// The notification keeper goes away in the middle and cannot be started again until the end.
class NotificationsWithoutPanel : public AppWorld
{
protected:
    NotificationsWithoutPanel()
        : file_(std::string(getenv("XDG_DATA_HOME")) + "/dbus-1/services/" + panelName + ".service")
    {
        g_current_node = addNode(7, {"/a"}, 5000, "Ann?", "31?");
        ad->is_resume_by_reboot = 1;
        ad->has_upload_resume = 1;
    }
    ~NotificationsWithoutPanel() override
    {
        if (!away_)
            return;
        std::filesystem::rename(file_ + ".away", file_);
        reloadBusConfiguration();
    }

    void takePanelAway()
    {
        std::filesystem::rename(file_, file_ + ".away");
        away_ = true;
        reloadBusConfiguration();
        panel_testing::killOwner(panelName);
        log.restart();
    }

    std::string lastLine() const { return log.messages().back(); }

private:
    std::string file_;
    bool away_ = false;
};

TEST_F(NotificationsWithoutPanel, AFailedTickerLeavesThePreparingNotificationUnposted)
{
    takePanelAway();
    addProgressNotification(0, &g_current_node->notif);
    EXPECT_NE(g_current_node->notif, nullptr);
    EXPECT_THAT(log.messages(),
                ElementsAre("Adding new notification with title = <Preparing to upload>",
                            MatchesRegex("fail to insert notification text\\[-[0-9]+\\]")));
}

TEST_F(NotificationsWithoutPanel, AFailedPostIsReturned)
{
    takePanelAway();
    notification_h notification = notification_create(NOTIFICATION_TYPE_ONGOING);
    EXPECT_LT(_notificationInsert(notification, NOTI_STATE_SENDING), 0);
    notification_free(notification);
    EXPECT_THAT(log.messages(),
                ElementsAre("Populating tag from current node...", "Request id found = 7",
                            "node->noti_priv_id = 7", "notification_post failed..."));
}

TEST_F(NotificationsWithoutPanel, DeletingAllOfATypeIsLogged)
{
    takePanelAway();
    deleteAllNotificationsOfType(NOTIFICATION_TYPE_ONGOING);
    EXPECT_THAT(log.messages(),
                ElementsAre(MatchesRegex("notification_delete_all error \\[-[0-9]+\\]")));
}

TEST_F(NotificationsWithoutPanel, AFailedDeletionLeavesHandleAndTagSet)
{
    addProgressNotification(0, &g_current_node->notif);
    ASSERT_TRUE(posted("7"));
    takePanelAway();
    const notification_h shown = g_current_node->notif;
    EXPECT_EQ(deleteNotificationById(&g_current_node->notif, g_current_node->noti_priv_id), 0);
    EXPECT_EQ(g_current_node->notif, shown);
    EXPECT_STREQ(g_current_node->noti_priv_id, "7");
    EXPECT_THAT(log.messages(),
                ElementsAre("noti_id = 7", "************* Removing Noti = 7*******************",
                            "notification_delete failed...",
                            MatchesRegex("notification_delete_by_priv_id error \\[-[0-9]+\\]")));
}

TEST_F(NotificationsWithoutPanel, SendingThatCannotBePostedReportsNothing)
{
    addProgressNotification(0, &g_current_node->notif);
    takePanelAway();
    EXPECT_EQ(updateUploadNotificationSendingStatus(ad, 40, &g_current_node->notif,
                                                    g_current_node->noti_priv_id),
              0);
    EXPECT_THAT(lastLine(), MatchesRegex("_notificationInsert failed \\[-[0-9]+\\]"));
}

TEST_F(NotificationsWithoutPanel, TheOtherStatesOnlyLogTheirFailure)
{
    takePanelAway();
    updateUploadNotificationWaitForNoti();
    EXPECT_THAT(lastLine(), MatchesRegex("_notificationInsert fail, noti_err = -[0-9]+"));
    uploadAddFailedNotification(ad, 2, -16);
    EXPECT_THAT(lastLine(), MatchesRegex("_notificationInsert failed \\[-[0-9]+\\]"));
    updateUploadNotificationSent(1);
    EXPECT_THAT(lastLine(), MatchesRegex("_notificationInsert failed \\[-[0-9]+\\]"));
    EXPECT_EQ(ad->is_resume_by_reboot, 1) << "the ticker was not posted";
    EXPECT_EQ(ad->has_upload_resume, 1);
}

TEST_F(NotificationsWithoutPanel, SendersOfSharesThatCouldNotBeAnnouncedAreKept)
{
    ad->sender_name = g_strdup("Ann");
    addSenderName("Ann");
    ad->token_length = 2;
    takePanelAway();
    EXPECT_EQ(addPushNotification(ad), -1);
    ad->token_length = 0;
    EXPECT_STREQ(g_sender_info[0], "Ann");
    EXPECT_THAT(lastLine(), MatchesRegex("notification_post fail, noti_err = -[0-9]+"));
}

TEST_F(NotificationsWithoutPanel, SwitchingTheServiceOffKeepsNoTokens)
{
    preference_set_int(shareNotiBackupedKey, 2);
    preference_set_string(shareNotiTokensKey, "T1|T2");
    takePanelAway();
    backupNotiInfo(ad);
    int count = -1;
    EXPECT_EQ(preference_get_int(shareNotiBackupedKey, &count), PREFERENCE_ERROR_NONE);
    EXPECT_EQ(count, 0);
}

} // namespace
} // namespace pelliko::test
