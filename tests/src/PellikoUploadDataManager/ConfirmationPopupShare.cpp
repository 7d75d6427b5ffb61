// The button that shares: what the service is asked for, and each of its answers.
#include "ConfirmationPopupScene.h"
#include "PellikoUploadDataManager/RecipientTexts.h"

#include <glib.h>
#include <gmock/gmock.h>

namespace pelliko
{
namespace
{

using test::ConfirmationPopup;
using ::testing::Contains;
using ::testing::HasSubstr;
using ::testing::Not;

TEST_F(ConfirmationPopup, ShareHandsTheFilesOverAndHides)
{
    service.answerRequests(0, 7);
    share(1, 1500, {{"Ann"}});
    ad->upload_item->files = eina_list_append(nullptr, g_strdup("/a/b.jpg"));
    openPopup();
    setRecipientTexts("Somebody else?", "99?"); // a report about another upload came in between
    press(button("button2"));
    ASSERT_TRUE(closes());
    expectNothingLeft();
    EXPECT_FALSE(isOnScreen());
    EXPECT_THAT(service.calls(),
                ::testing::ElementsAre("RequestUpload ((1, 0), [('', '+447700900123', 31)], "
                                       "[b'/a/b.jpg'], false)"));
    ASSERT_NE(g_upload_noti_data_list, nullptr);
    EXPECT_EQ(g_upload_noti_data_list->request_id, 7);
    EXPECT_EQ(g_upload_noti_data_list->upload_status, 2);
    EXPECT_STREQ(g_upload_noti_data_list->recipient_list, "Ann?");
    EXPECT_STREQ(g_upload_noti_data_list->recipient_index_list, "31?");
    const auto lines = log.messages();
    EXPECT_THAT(lines, Contains("Action type is ACTION_UPLOAD"));
    EXPECT_EQ(lines.back(), "uploadStart ret = 0");
}

// Presses that were made before the popup closed may still be delivered while its button is in use.
TEST_F(ConfirmationPopup, SeveralPressesInARowShareOnce)
{
    service.answerRequests(0, 7);
    share(1, 1500, {{"Ann"}});
    ad->upload_item->files = eina_list_append(nullptr, g_strdup("/a/b.jpg"));
    openPopup();
    Evas_Object *share_button = button("button2");
    evas_object_ref(share_button);
    for (int i = 0; i < 3; ++i)
        evas_object_smart_callback_call(share_button, "clicked", nullptr);
    evas_object_unref(share_button);
    EXPECT_EQ(ad->popup, nullptr);
    EXPECT_EQ(service.calls().size(), 1U);
}

TEST_F(ConfirmationPopup, ReshareTakesTheNodeOfTheNewRequest)
{
    service.answerInfo(3, 5000);
    service.answerRequests(0, 8);
    ad->action_type = ACTION_RESHARE_UPLOAD;
    ad->req_id_to_reshare = 5;
    share(0, 0, {{"Ann"}});
    openPopup();
    press(button("button2"));
    ASSERT_TRUE(closes());
    EXPECT_EQ(service.calls().back(),
              "RequestReshare ((1, 0), [('', '+447700900123', 31)], 5, false)");
    UploadNotiData *node = getUploadNotiDataNode(8);
    ASSERT_NE(node, nullptr);
    EXPECT_EQ(node->upload_status, 2);
    EXPECT_EQ(node->total_files, 3);
    EXPECT_EQ(log.messages()[log.messages().size() - 2], "reshareUploadStart ret = 0");
}

TEST_F(ConfirmationPopup, EmptyShareStartsWithoutAsking)
{
    service.answerRequests(0, 7);
    share(1, 0, {{"Ann"}});
    ad->upload_item->files = eina_list_append(nullptr, g_strdup("/a/b.jpg"));
    _createPopupView(ad);
    expectNothingLeft();
    EXPECT_FALSE(isOnScreen());
    EXPECT_EQ(service.calls().size(), 1U);
    EXPECT_THAT(log.messages(),
                Contains("6MB limit not exceeded. Bypassing Confirmation popup view"));
}

TEST_F(ConfirmationPopup, ServerErrorEndsTheApplicationOnceThePopupIsGone)
{
    service.answerRequests(-16);
    share(1, 1500, {{"Ann"}});
    ad->upload_item->files = eina_list_append(nullptr, g_strdup("/a/b.jpg"));
    openPopup();
    press(button("button2"));
    ASSERT_TRUE(closes());
    EXPECT_EQ(g_upload_noti_data_list, nullptr);
    const auto lines = log.messages();
    EXPECT_THAT(lines, Contains("Upload error, ret = -16"));
    EXPECT_THAT(lines, Contains("Popup is open.. can't exit"));
    EXPECT_EQ(lines.back(), "No upload_data request id exist so app is exiting");
}

TEST_F(ConfirmationPopup, RefusedShareLeavesOlderUploadsAlone)
{
    service.answerRequests(-5);
    addUploadNotiDataNode()->request_id = 3;
    share(1, 1500, {{"Ann"}});
    ad->upload_item->files = eina_list_append(nullptr, g_strdup("/a/b.jpg"));
    openPopup();
    press(button("button2"));
    ASSERT_TRUE(closes());
    ASSERT_NE(g_upload_noti_data_list, nullptr);
    EXPECT_EQ(g_upload_noti_data_list->request_id, 3);
    EXPECT_EQ(g_upload_noti_data_list->next, nullptr);
    EXPECT_EQ(log.messages().back(), "upload_data request id is not 0 app can't exit");
}

TEST_F(ConfirmationPopup, StartingServiceOpensTheShareFailurePopupAndOkLeaves)
{
    service.beInitializing();
    share(1, 1500, {{"Ann"}});
    ad->upload_item->files = eina_list_append(nullptr, g_strdup("/a/b.jpg"));
    openPopup();
    press(button("button2"));
    ASSERT_TRUE(closes());
    EXPECT_TRUE(isOnScreen());
    EXPECT_EQ(g_upload_noti_data_list, nullptr);
    EXPECT_THAT(log.messages(), Contains("Error - PELLIKO_ERROR_SERVICE_INITIALIZING"));
    EXPECT_THAT(log.messages(), Not(Contains(HasSubstr("exit"))));
    pressKey("Escape");
    EXPECT_TRUE(waitUntil([this] {
        return log.messages().back() == "No upload_data request id exist so app is exiting";
    }));
}

} // namespace
} // namespace pelliko
