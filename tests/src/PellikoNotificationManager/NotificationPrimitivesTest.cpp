#include "PellikoNotificationManager/NotificationPrimitives.h"
#include "PellikoUploadDataManager/RecipientTexts.h"
#include "support/AppWorld.h"

#include <app_control.h>

namespace pelliko::test
{
namespace
{

class NotificationPrimitives : public AppWorld
{
protected:
    NotificationPrimitives() { app_control_create(&request); }
    ~NotificationPrimitives() override { app_control_destroy(request); }

    std::string extra(const char *key) const
    {
        char *value = nullptr;
        if (app_control_get_extra_data(request, key, &value) != APP_CONTROL_ERROR_NONE)
            return "(absent)";
        std::string text(value);
        free(value);
        return text;
    }

    notification_h ongoing(const char *title = "title") const
    {
        notification_h notification = notification_create(NOTIFICATION_TYPE_ONGOING);
        notification_set_text(notification, NOTIFICATION_TEXT_TYPE_TITLE, title, nullptr,
                              NOTIFICATION_VARIABLE_TYPE_NONE);
        return notification;
    }

    app_control_h request = nullptr;
};

TEST_F(NotificationPrimitives, TheFiguresOfANodeAreAddedInOrder)
{
    g_current_node = addNode(7, {"/a", "/b"}, 5000, "Ann?Bob+SMS?Eve?", "31?32?33?");
    _addExtraData(request, NOTI_STATE_SENDING);
    EXPECT_EQ(log.text(), "Populating extra data from current node...\n"
                          "Adding total recipients = 3\n"
                          "Adding recipient index list to extra data. list = 31?32?33?\n"
                          "Adding recipient list to extra data. list = Ann?Bob+SMS?Eve?\n"
                          "Adding total files = 2\n"
                          "Adding status = 3\n"
                          "Adding request id = 7\n"
                          "Adding total size = 5000\n");
    EXPECT_EQ(extra("recipient_count"), "3");
    EXPECT_EQ(extra("recipient_index_list"), "31?32?33?");
    EXPECT_EQ(extra("recipient_list"), "Ann?Bob+SMS?Eve?");
    EXPECT_EQ(extra("total_files"), "2");
    EXPECT_EQ(extra("upload_status"), "3");
    EXPECT_EQ(extra("upload_request_id"), "7");
    EXPECT_EQ(extra("total_size"), "5000");
}

TEST_F(NotificationPrimitives, AnEmptyRecipientListCountsZeroAndFailsOnlyForItsOwnKeys)
{
    g_current_node = addNode(7, {"/a"}, 10, "", "");
    _addExtraData(request, NOTI_STATE_PAUSED);
    EXPECT_EQ(log.text(), "Populating extra data from current node...\n"
                          "Adding total recipients = 0\n"
                          "Adding recipient index list to extra data. list = \n"
                          "app control error recieved.\n"
                          "Adding recipient list to extra data. list = \n"
                          "app control error recieved.\n"
                          "Adding total files = 1\n"
                          "Adding status = 1\n"
                          "Adding request id = 7\n"
                          "Adding total size = 10\n");
    EXPECT_EQ(extra("recipient_list"), "(absent)");
    EXPECT_EQ(extra("total_size"), "10");
}

TEST_F(NotificationPrimitives, AQuestionMarkInANameCountsAsASeparator)
{
    g_current_node = addNode(7, {"/a"}, 10, "Who? Me?", "31?");
    _addExtraData(request, NOTI_STATE_SENDING);
    EXPECT_EQ(extra("recipient_count"), "2");
}

TEST_F(NotificationPrimitives, PreparingDescribesTheShareInHand)
{
    addNode(7, {"/x", "/y", "/z"}, 1, "Old?", "99?");
    g_current_node = g_upload_noti_data_list;
    shareInHand({"/a", "/b"}, 2);
    ad->upload_item->request_id = 8;
    ad->upload_item->files_size = 4321;
    log.restart();
    _addExtraData(request, NOTI_STATE_PREPARING);
    EXPECT_TRUE(log.has("Populating extra data from ad_upload_item..."));
    EXPECT_EQ(extra("recipient_count"), "2");
    EXPECT_EQ(extra("recipient_list"), "Ann?Bob+SMS?");
    EXPECT_EQ(extra("recipient_index_list"), "31?32?");
    EXPECT_EQ(extra("total_files"), "2");
    EXPECT_EQ(extra("upload_status"), "0");
    EXPECT_EQ(extra("upload_request_id"), "8");
    EXPECT_EQ(extra("total_size"), "4321");
}

TEST_F(NotificationPrimitives, PreparingWhileResumingDescribesTheNode)
{
    g_current_node = addNode(11, {"/a"}, 77, "Ann?", "31?");
    ad->is_resume_by_reboot = 1;
    ad->has_upload_resume = 1;
    _addExtraData(request, NOTI_STATE_PREPARING);
    EXPECT_EQ(extra("upload_request_id"), "11");
    EXPECT_EQ(extra("total_size"), "77");
}

TEST_F(NotificationPrimitives, AReportBetweenPopupAndShareLeavesItsOwnRecipientsInTheBuffers)
{
    shareInHand({"/a"}, 1);
    g_current_node = addNode(7, {"/x"}, 1, "Old?", "99?");
    _addExtraData(request, NOTI_STATE_SENDING);
    EXPECT_STREQ(getRecipientListText(), "Old?");
    EXPECT_STREQ(getRecipientIndexListText(), "99?");
}

TEST_F(NotificationPrimitives, WithoutAShareInHandTheFiguresAreZero)
{
    _addExtraData(request, NOTI_STATE_PREPARING);
    EXPECT_TRUE(log.has("Some fatal error occurred. ad_upload_data is null.")) << log.text();
    EXPECT_EQ(extra("upload_request_id"), "0");
}

TEST_F(NotificationPrimitives, WithoutANodeTheFiguresAreZero)
{
    _addExtraData(request, NOTI_STATE_SENT);
    EXPECT_TRUE(log.has("Some fatal error occurred. Current node is null.")) << log.text();
    EXPECT_EQ(extra("recipient_count"), "0");
    EXPECT_EQ(extra("upload_status"), "6");
}

TEST_F(NotificationPrimitives, RemovingAndAddingLeavesOneValuePerKey)
{
    g_current_node = addNode(7, {"/a"}, 10, "Ann?", "31?");
    _addExtraData(request, NOTI_STATE_PREPARING + 1);
    log.restart();
    _removeExtraData(request);
    EXPECT_EQ(log.text(), "");
    EXPECT_EQ(extra("recipient_count"), "(absent)");
    EXPECT_EQ(extra("upload_request_id"), "(absent)");
    EXPECT_EQ(extra("total_size"), "10");
    g_current_node->total_size = 20;
    _addExtraData(request, NOTI_STATE_SENT);
    EXPECT_EQ(extra("recipient_count"), "1");
    EXPECT_EQ(extra("upload_status"), "6");
    EXPECT_EQ(extra("total_size"), "20");
}

TEST_F(NotificationPrimitives, RemovingFromAFreshRequestLogsEachAbsentKey)
{
    _removeExtraData(request);
    std::string expected;
    for (int i = 0; i < 6; ++i)
        expected += "app control error recieved = -126\n";
    EXPECT_EQ(log.text(), expected);
}

TEST_F(NotificationPrimitives, InsertTagsWithTheRequestIdAndPosts)
{
    g_current_node = addNode(7, {"/a"}, 10, "Ann?", "31?");
    g_current_node->noti_priv_id[0] = '\0';
    notification_h notification = ongoing("hello");
    EXPECT_EQ(_notificationInsert(notification, NOTI_STATE_SENDING), 0);
    notification_free(notification);
    EXPECT_EQ(log.text(), "Populating tag from current node...\n"
                          "Request id found = 7\n"
                          "node->noti_priv_id = 7\n");
    ASSERT_TRUE(posted("7"));
    EXPECT_EQ(posted("7")->title, "hello");
}

TEST_F(NotificationPrimitives, InsertOfAReshareUsesTheNewRequestId)
{
    addNode(8, {}, 10, "Ann?", "31?");
    shareInHand({});
    ad->action_type = ACTION_RESHARE_UPLOAD;
    ad->reshared_request_id = 8;
    ad->upload_item->request_id = 5;
    log.restart();
    notification_h notification = ongoing();
    EXPECT_EQ(_notificationInsert(notification, NOTI_STATE_PREPARING), 0);
    notification_free(notification);
    EXPECT_EQ(log.text(), "Populating tag from ad_upload_item...\n"
                          "Request id found = 8\n"
                          "node->noti_priv_id = 8\n");
    EXPECT_TRUE(posted("8"));
}

TEST_F(NotificationPrimitives, InsertWithoutANodeInTheListPostsNothing)
{
    shareInHand({"/a"});
    ad->upload_item->request_id = 9;
    notification_h notification = ongoing();
    EXPECT_NE(_notificationInsert(notification, NOTI_STATE_PREPARING), 0);
    notification_free(notification);
    EXPECT_FALSE(posted("9"));
}

TEST_F(NotificationPrimitives, InsertWithoutAnyUploadEndsTheProcess)
{
    notification_h notification = ongoing();
    EXPECT_DEATH(_notificationInsert(notification, NOTI_STATE_SENDING), "");
    EXPECT_TRUE(log.has("Some fatal error occurred. g_current_node is null.")) << log.text();
    EXPECT_DEATH(_notificationInsert(notification, NOTI_STATE_PREPARING), "");
    EXPECT_TRUE(log.has("Some fatal error occurred.  ad->upload_item is null.")) << log.text();
    notification_free(notification);
}

TEST_F(NotificationPrimitives, DeletingTakesNotificationHandleAndTagAway)
{
    g_current_node = addNode(7, {"/a"}, 10, "Ann?", "31?");
    g_current_node->notif = ongoing();
    ASSERT_EQ(_notificationInsert(g_current_node->notif, NOTI_STATE_SENDING), 0);
    log.restart();
    EXPECT_EQ(deleteNotificationById(&g_current_node->notif, g_current_node->noti_priv_id), 1);
    EXPECT_EQ(log.text(), "noti_id = 7\n"
                          "************* Removing Noti = 7*******************\n");
    EXPECT_EQ(g_current_node->notif, nullptr);
    EXPECT_STREQ(g_current_node->noti_priv_id, "");
    EXPECT_FALSE(posted("7"));
}

TEST_F(NotificationPrimitives, DeletingAnEmptySlotChangesNothing)
{
    g_current_node = addNode(7, {"/a"}, 10, "Ann?", "31?");
    EXPECT_EQ(deleteNotificationById(&g_current_node->notif, g_current_node->noti_priv_id), 0);
    EXPECT_EQ(log.text(), "noti_id = 7\nNotification is null, returning\n");
    EXPECT_STREQ(g_current_node->noti_priv_id, "7");
    EXPECT_EQ(deleteNotificationById(&g_current_node->notif, nullptr), 0);
}

TEST_F(NotificationPrimitives, ADeletionThatFailsLeavesHandleAndTag)
{
    g_current_node = addNode(7, {"/a"}, 10, "Ann?", "31?");
    g_current_node->notif = ongoing(); // never posted, or swiped away meanwhile
    EXPECT_EQ(deleteNotificationById(&g_current_node->notif, g_current_node->noti_priv_id), 0);
    EXPECT_NE(g_current_node->notif, nullptr);
    EXPECT_STREQ(g_current_node->noti_priv_id, "7");
    EXPECT_TRUE(log.has("notification_delete failed...")) << log.text();
    EXPECT_NE(log.text().find("notification_delete_by_priv_id error ["), std::string::npos);
}

TEST_F(NotificationPrimitives, AllOfOneTypeGoAndTheOthersStay)
{
    addNode(7, {"/a"}, 10, "Ann?", "31?");
    addNode(8, {"/a"}, 10, "Ann?", "31?");
    g_current_node = getUploadNotiDataNode(7);
    notification_h notification = ongoing();
    _notificationInsert(notification, NOTI_STATE_SENDING);
    notification_free(notification);
    g_current_node = getUploadNotiDataNode(8);
    notification = notification_create(NOTIFICATION_TYPE_NOTI);
    _notificationInsert(notification, NOTI_STATE_SENT);
    notification_free(notification);
    deleteAllNotificationsOfType(NOTIFICATION_TYPE_ONGOING);
    EXPECT_FALSE(posted("7"));
    EXPECT_TRUE(posted("8"));
}

} // namespace
} // namespace pelliko::test
