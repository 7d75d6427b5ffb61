// What is pressed: cancel, OK, the back key, another notification.
#include "PellikoUploadDataManager/ConfirmationPopup.h"
#include "PellikoUploadingDataManager/StatusPopupScene.h"
#include "support/UsageRecords.h"

#include <gmock/gmock.h>

namespace pelliko::test
{
namespace
{

using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::Not;

constexpr const char *quits = "No upload_data request id exist so app is exiting";

TEST_F(StatusPopup, CancelTakesTheUploadBackOnce)
{
    const UsageRecords usage;
    const UploadNotiData *node = pending(45);
    tap({});
    press(ad->cancel_button);
    ASSERT_TRUE(waitUntil([this] { return ad->cancel_button == nullptr; }));
    EXPECT_EQ(ad->progressbar, nullptr);
    EXPECT_EQ(node->upload_status, 5);
    EXPECT_EQ(g_cancel_in_progress, 1);
    EXPECT_THAT(service.calls(), ElementsAre("Cancel (7,)"));
    EXPECT_THAT(usage.features(), ElementsAre("PK08"));
    EXPECT_NE(ad->popup, nullptr);
    // Progress that was under way already.
    updatePopupStatus(2, 50, 0);
    EXPECT_EQ(ad->cancel_button, nullptr);
    report(5);
    EXPECT_TRUE(waitUntil([this] { return statusLine() == "Sending has been cancelled."; }));
    EXPECT_EQ(g_upload_noti_data_list, nullptr);
    press(okButton());
    ASSERT_TRUE(closes());
    EXPECT_EQ(log.messages().back(), quits);
}

TEST_F(StatusPopup, NextTapMayCancelAgain)
{
    pending(45, 7);
    const UploadNotiData *other = pending(10, 8);
    launch({});
    cancelUploadCb(ad, ad->cancel_button, nullptr);
    launch({.request_id = 8});
    EXPECT_EQ(g_cancel_in_progress, 0);
    cancelUploadCb(ad, ad->cancel_button, nullptr);
    EXPECT_EQ(other->upload_status, 5);
    EXPECT_THAT(service.calls(), ElementsAre("Cancel (7,)", "Cancel (8,)"));
}

TEST_F(StatusPopup, UploadThatHasEndedCanBeTappedTwiceInARow)
{
    launch({});
    const Evas_Object *first = ad->popup;
    launch({});
    EXPECT_NE(ad->popup, first);
    EXPECT_EQ(bar(), 0.0);
    cancelUploadCb(ad, ad->cancel_button, nullptr);
    EXPECT_EQ(g_upload_noti_data_list, nullptr);
    EXPECT_THAT(service.calls(), ElementsAre("Cancel (7,)"));
}

TEST_F(StatusPopup, OkLeavesAnUploadThatGoesOnAlone)
{
    for (const int state : {0, 1, 2, 3, 5}) {
        log.restart();
        tap({.state = state});
        press(okButton());
        ASSERT_TRUE(closes());
        EXPECT_FALSE(isOnScreen());
        EXPECT_EQ(popup_update_enabled, 0);
        EXPECT_EQ(is_noti_pressed, 1);
        EXPECT_THAT(log.messages(), Not(Contains(quits))) << state;
    }
}

TEST_F(StatusPopup, OkEndsTheApplicationWithAnUploadThatHasEnded)
{
    for (const int state : {4, 6, 8, 9}) {
        tap({.state = state});
        press(okButton());
        ASSERT_TRUE(closes());
        EXPECT_EQ(log.messages().back(), quits) << state;
    }
    pending(10, 8);
    tap({.state = 6});
    pressKey("Escape");
    ASSERT_TRUE(closes());
    EXPECT_FALSE(isOnScreen());
    EXPECT_EQ(log.messages().back(), "upload_data request id is not 0 app can't exit");
}

TEST_F(StatusPopup, ClosingTheWindowIsOk)
{
    launch({.state = 6});
    evas_object_smart_callback_call(ad->win, "delete,request", nullptr);
    EXPECT_EQ(ad->popup, nullptr);
    EXPECT_EQ(log.messages().back(), quits);
}

TEST_F(StatusPopup, TapTakesThePlaceOfAnOpenConfirmation)
{
    share(1, 1500, {{"Ann"}, {"Bo"}});
    _createPopupView(ad);
    launch({});
    EXPECT_TRUE(isStatusPopup(ad));
    EXPECT_EQ(elm_object_part_content_get(ad->popup, "button2"), nullptr);
    EXPECT_EQ(ad->wifi_check_box, nullptr);
}

TEST_F(StatusPopup, MessagesThatAreSentMeanwhileDoNotDisturbIt)
{
    tap({});
    ad->operation_type = OPERATION_SEND_SMS; // and no share in hand
    speak("de_DE.UTF-8");
    EXPECT_EQ(statusLine(), "Wird gesendet …");
    evas_object_smart_callback_call(ad->win, "wm,rotation,changed", nullptr);
    EXPECT_TRUE(isStatusPopup(ad));
    press(okButton());
    ASSERT_TRUE(closes());
    EXPECT_EQ(is_noti_pressed, 0);
    EXPECT_EQ(log.messages().back(), quits);
}

TEST_F(StatusPopup, CheckBoxStandsFastWhileATappedUploadIsInHand)
{
    share(1, 1500, {{"Ann"}});
    _createPopupView(ad);
    g_noti_press_data.upload_request_id = 7;
    ad->operation_type = OPERATION_UPLOADING_NOTI_PRESSED;
    ASSERT_TRUE(settle(ad->wifi_check_box));
    const Box layout = boxOf(ad->popup_layout), check = boxOf(ad->wifi_check_box);
    pressAt(layout.x + layout.width - 24, check.y + check.height / 2);
    EXPECT_TRUE(waitUntil([this] { return log.messages().back() == "request_id = 7"; }));
    EXPECT_EQ(ad->wifi_check, 0);
    EXPECT_FALSE(elm_check_state_get(ad->wifi_check_box));
}

} // namespace
} // namespace pelliko::test
