#include "PellikoUploadDataManager/Recipients.h"
#include "PellikoUploadManager/UploadStatus.h"
#include "support/AppWorld.h"

#include <Elementary.h>

namespace pelliko::test
{
namespace
{

constexpr const char *stays = "upload_data request id is not 0 app can't exit";

// What the end of an upload does to the window.
class UploadStatusWindow : public AppWorld
{
protected:
    UploadStatusWindow()
    {
        elm_policy_set(ELM_POLICY_QUIT, ELM_POLICY_QUIT_NONE);
        ad->win = elm_win_util_standard_add("pelliko", "pelliko");
        evas_object_resize(ad->win, 100, 100);
        evas_object_show(ad->win);
        addNode(7, {"/a"}, 10, "Ann?", "31?");
        popup_update_enabled = 1;
        log.restart();
    }
    ~UploadStatusWindow() override
    {
        if (ad->popup)
            evas_object_del(ad->popup);
        ad->popup = nullptr;
        evas_object_del(ad->win);
        ad->win = nullptr;
    }

    void finish() { uploadResponseStatusCb(7, nullptr, 0, 0, 0, 0, 7, ad); }
    bool isShown() const { return evas_object_visible_get(ad->win); }
};

TEST_F(UploadStatusWindow, TheEndOfOneUploadHidesItWhileAnotherIsPending)
{
    UploadNotiData *other = addNode(8, {"/b"}, 10, "Bob?", "32?");
    finish();
    EXPECT_EQ(g_upload_noti_data_list, other);
    EXPECT_FALSE(isShown());
    EXPECT_EQ(popup_update_enabled, 0);
    EXPECT_EQ(log.messages()[log.messages().size() - 2], "Exit app, no need to wait sending SMS");
    EXPECT_EQ(log.messages().back(), stays);
}

TEST_F(UploadStatusWindow, AShareThatOwesMessagesHidesItAndStays)
{
    g_has_sms_receiver = 1;
    finish();
    EXPECT_FALSE(isShown());
    EXPECT_TRUE(log.has("waiting for sending SMS"));
    EXPECT_FALSE(log.has("No upload_data request id exist so app is exiting"));
}

TEST_F(UploadStatusWindow, AnApplicationThatSendsTheMessagesHidesItAndStays)
{
    ad->operation_type = OPERATION_SEND_SMS;
    finish();
    EXPECT_FALSE(isShown());
    EXPECT_TRUE(log.has("waiting for sending SMS under SMS operation"));
    EXPECT_FALSE(log.has("No upload_data request id exist so app is exiting"));
}

TEST_F(UploadStatusWindow, AnOpenPopupStaysOverTheEndOfAnotherUpload)
{
    ad->popup = elm_popup_add(ad->win);
    evas_object_show(ad->popup);
    g_has_sms_receiver = 1;
    finish();
    EXPECT_TRUE(isShown());
    EXPECT_NE(ad->popup, nullptr);
    EXPECT_EQ(log.messages().back(), "req_id = 7 and g_noti_press_data.upload_request_id = 0");
    EXPECT_FALSE(log.has("waiting for sending SMS"));
}

TEST_F(UploadStatusWindow, AFailureHidesItWhileAnotherIsPending)
{
    addNode(8, {"/b"}, 10, "Bob?", "32?");
    uploadResponseStatusCb(2, nullptr, 10, 0, 0, -16, 7, ad);
    EXPECT_FALSE(isShown());
    EXPECT_EQ(log.messages()[log.messages().size() - 2], stays);
    EXPECT_EQ(log.messages().back(), "Ongoing uploads. Can't exit.");
}

TEST_F(UploadStatusWindow, ACancelledUploadLeavesItAlone)
{
    uploadResponseStatusCb(5, nullptr, 0, 0, 0, 0, 7, ad);
    EXPECT_TRUE(isShown());
    EXPECT_EQ(g_upload_noti_data_list, nullptr);
}

} // namespace
} // namespace pelliko::test
