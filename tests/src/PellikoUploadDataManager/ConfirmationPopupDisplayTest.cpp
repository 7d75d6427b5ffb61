// What the popup shows, and how it is left.
#include "ConfirmationPopupScene.h"
#include "PellikoUploadDataManager/RecipientTexts.h"
#include "PellikoUploadManager/ExitPolicy.h"

#include <contacts.h>
#include <gmock/gmock.h>

namespace pelliko
{
namespace
{

using test::ConfirmationPopup;
using ::testing::Contains;
using ::testing::HasSubstr;

TEST_F(ConfirmationPopup, OneRecipientGetsTheSingleLayoutWithASummary)
{
    share(1, 1500, {{"Anna Müller", true}});
    openPopup();
    picture = "confirmation-single";
    EXPECT_THAT(log.messages(), Contains("Setting confirmation_popup_share_view_single"));
    EXPECT_THAT(log.messages(), Contains("ad->operation_type =4,g_total_recipients =1"));
    EXPECT_STREQ(elm_object_part_text_get(ad->popup, "title,text"), "Share files via Pelliko");
    EXPECT_EQ(body(), "To avoid extra charges, share via Wi‑Fi only.");
    EXPECT_EQ(layoutText("elm.text.info"), "1 file <br>(1.00KB)");
    EXPECT_EQ(layoutText("elm.text"), "Share via Wi-Fi only");
    EXPECT_STREQ(elm_object_text_get(button("button1")), "Cancel");
    EXPECT_STREQ(elm_object_text_get(button("button2")), "Share");
    EXPECT_STREQ(getRecipientListText(), "Anna Müller+SMS?");
    EXPECT_STREQ(getRecipientIndexListText(), "31?");
    EXPECT_TRUE(isOnScreen());
}

TEST_F(ConfirmationPopup, SeveralRecipientsGetAHeadingAndARow)
{
    unsupported_file_count = 2;
    const std::string photo =
        "/opt/usr/apps/com.velmora.pelliko/shared/res/com.velmora.pelliko.png";
    share(4, 3 << 20,
          {{"Maximiliana von Hohenstein-Wernigerode", true},
           {"Ωμέγα Παπαδοπούλου", false, photo},
           {"Анна Каренина", true},
           {"Bo"},
           {"محمد", true},
           {"Zoë & <b>Co</b>", false, "/nowhere.png"}});
    openPopup();
    picture = "confirmation-several";
    EXPECT_EQ(layoutText("elm.swallow.label.text"), "Recipients (6)");
    EXPECT_EQ(body(),
              "4 files (3.00MB)<br><br>2 files are not supported and will not be shared. To "
              "avoid extra charges, share via Wi‑Fi only.");
    const auto lines = log.messages();
    EXPECT_THAT(lines, Contains("Setting confirmation_popup_share_view_multiple"));
    EXPECT_THAT(lines, Contains("Adding recipient- name = Zoë & <b>Co</b>"));
    EXPECT_THAT(lines, Contains("Setting recipient image = " + photo));
    // A picture that cannot be read gives way to the default one.
    EXPECT_EQ(std::count(lines.begin(), lines.end(),
                         "Setting default contact image = /opt/usr/apps/com.velmora.pelliko/res/"
                         "images/sender-images/WVGA/pk_caller_id_default.png"),
              5);
    EXPECT_EQ(std::count(lines.begin(), lines.end(), "Setting SMS badge."), 3);
}

TEST_F(ConfirmationPopup, NoRecipientGetsTheLayoutForSeveral)
{
    share(1, 1500, {});
    openPopup();
    EXPECT_THAT(log.messages(), Contains("Setting confirmation_popup_share_view_multiple"));
    EXPECT_EQ(layoutText("elm.swallow.label.text"), "");
}

TEST_F(ConfirmationPopup, ReshareAsksTheServiceForTheFilesAndShowsWhateverTheirSize)
{
    service.answerInfo(3, 5000000);
    ad->action_type = ACTION_RESHARE_UPLOAD;
    ad->req_id_to_reshare = 5;
    share(0, 0, {{"Anna Müller", true}, {"Bob"}});
    openPopup();
    picture = "confirmation-reshare";
    EXPECT_THAT(service.calls(), ::testing::ElementsAre("GetUploadInfo (5,)"));
    EXPECT_EQ(ad->upload_item->files_count, 3);
    EXPECT_EQ(ad->upload_item->files_size, 5000000);
    EXPECT_EQ(body(), "3 files (4.77MB)<br><br>Tap Share to share again. The files are already on "
                      "the server, so there are no data charges.");
    EXPECT_THAT(log.messages(), Contains("Setting confirmation_popup_reshare_view_multiple"));
}

TEST_F(ConfirmationPopup, ReshareKeepsTheParsedFiguresWhenTheServiceDoesNotKnow)
{
    ad->action_type = ACTION_RESHARE_UPLOAD;
    ad->req_id_to_reshare = 5;
    share(2, 4096, {{"Anna"}});
    openPopup();
    EXPECT_EQ(ad->upload_item->files_count, 2);
    EXPECT_EQ(layoutText("elm.text.info"), "2 files <br>(4.00KB)");
    EXPECT_THAT(log.messages(), Contains("Setting confirmation_popup_reshare_view_single"));
    EXPECT_THAT(log.messages(), Contains("pelliko_upload_info_get_handle failed. Error = -1"));
}

TEST_F(ConfirmationPopup, LanguageChangeRetextsTheOpenPopup)
{
    unsupported_file_count = 1;
    share(2, 1500000, {{"Anna Müller", true}});
    openPopup();
    Evas_Object *popup = ad->popup;
    speak("de_DE.UTF-8");
    ASSERT_TRUE(settle(button("button2")));
    picture = "confirmation-german";
    EXPECT_EQ(ad->popup, popup);
    EXPECT_STREQ(elm_object_part_text_get(ad->popup, "title,text"), "Dateien über Pelliko teilen");
    EXPECT_EQ(body(), "1 Datei wird nicht unterstützt und nicht geteilt. Nur über WLAN teilen, um "
                      "Zusatzkosten zu vermeiden.");
    EXPECT_EQ(layoutText("elm.text.info"), "2 Dateien <br>(1,43MB)");
    EXPECT_EQ(layoutText("elm.text"), "Nur über WLAN teilen");
    EXPECT_STREQ(elm_object_text_get(button("button1")), "Abbrechen");
    EXPECT_STREQ(elm_object_text_get(button("button2")), "Teilen");
}

TEST_F(ConfirmationPopup, LanguageChangeRetextsEveryVariant)
{
    const std::vector<std::vector<test::Person>> people = {{{"Ann"}}, {{"Ann"}, {"Bo", true}}};
    for (const int action : {ACTION_UPLOAD, ACTION_RESHARE_UPLOAD}) {
        for (const auto &recipients : people) {
            ad->action_type = action;
            share(2, 1500000, recipients);
            openPopup();
            speak("de_DE.UTF-8");
            EXPECT_EQ(layoutText("elm.text"), "Nur über WLAN teilen");
            EXPECT_STREQ(elm_object_text_get(button("button1")), "Abbrechen");
            EXPECT_STREQ(elm_object_text_get(button("button2")), "Teilen");
            if (recipients.size() == 1)
                EXPECT_EQ(layoutText("elm.text.info"), "2 Dateien <br>(1,43MB)");
            else
                EXPECT_EQ(layoutText("elm.swallow.label.text"), "Empfänger (2)");
            EXPECT_THAT(body(), HasSubstr(action == ACTION_UPLOAD ? "WLAN" : "Server"));
            speak("en_GB.UTF-8");
        }
    }
}

TEST_F(ConfirmationPopup, WholeRowOfTheCheckBoxAnswersToThePointer)
{
    share(1, 1500, {{"Anna"}});
    openPopup();
    EXPECT_EQ(ad->wifi_check, 0);
    const Box layout = boxOf(ad->popup_layout), check = boxOf(ad->wifi_check_box);
    pressAt(layout.x + layout.width - 24, check.y + check.height / 2);
    EXPECT_TRUE(waitUntil([this] { return ad->wifi_check == 1; }));
    EXPECT_TRUE(elm_check_state_get(ad->wifi_check_box));
    ASSERT_TRUE(settle(ad->wifi_check_box));
    picture = "confirmation-wifi-only";
    press(ad->wifi_check_box);
    EXPECT_TRUE(waitUntil([this] { return ad->wifi_check == 0; }));
    EXPECT_FALSE(elm_check_state_get(ad->wifi_check_box));
}

TEST_F(ConfirmationPopup, CheckBoxAnswersToTheKeyboard)
{
    share(1, 1500, {{"Anna"}});
    openPopup();
    elm_object_focus_set(ad->wifi_check_box, EINA_TRUE);
    pressKey("space");
    EXPECT_TRUE(waitUntil([this] { return ad->wifi_check == 1; }));
    EXPECT_TRUE(elm_check_state_get(ad->wifi_check_box));
}

TEST_F(ConfirmationPopup, RotationRebuildsThePopupAndKeepsTheBox)
{
    contacts_connect();
    share(1, 1500, {});
    ad->number_id_count = 0;
    bypassContactView(ad);
    ASSERT_TRUE(settle(button("button2")));
    for (const uint8_t wifi_only : {1, 0}) {
        press(ad->wifi_check_box);
        ASSERT_TRUE(waitUntil([&] { return ad->wifi_check == wifi_only; }));
        const Evas_Object *before = ad->popup;
        evas_object_smart_callback_call(ad->win, "wm,rotation,changed", nullptr);
        EXPECT_NE(ad->popup, before);
        EXPECT_EQ(ad->wifi_check, wifi_only);
        EXPECT_EQ(elm_check_state_get(ad->wifi_check_box), wifi_only);
        ASSERT_TRUE(settle(button("button2")));
    }
    EXPECT_THAT(log.messages(), Contains("ad->wifi_check = 1"));
}

TEST_F(ConfirmationPopup, NextShareStartsUncheckedAndListensOnce)
{
    contacts_connect();
    share(1, 1500, {});
    bypassContactView(ad);
    ad->wifi_check = 1;
    evas_object_smart_callback_call(ad->win, "wm,rotation,changed", nullptr);
    bypassContactView(ad);
    EXPECT_EQ(ad->wifi_check, 0);
    log.restart();
    evas_object_smart_callback_call(ad->win, "wm,rotation,changed", nullptr);
    const auto lines = log.messages();
    EXPECT_EQ(std::count(lines.begin(), lines.end(), "ad->wifi_check = 0"), 1);
}

TEST_F(ConfirmationPopup, CancelForgetsTheChoiceAndLeaves)
{
    share(1, 1500, {{"Anna"}});
    openPopup();
    ad->wifi_check = 1;
    press(button("button1"));
    ASSERT_TRUE(closes());
    expectNothingLeft();
    EXPECT_EQ(ad->wifi_check, 0);
    EXPECT_EQ(log.messages().back(), "No upload_data request id exist so app is exiting");
}

TEST_F(ConfirmationPopup, CancelHidesTheWindowWhileAnUploadIsPending)
{
    addUploadNotiDataNode()->request_id = 3;
    share(1, 1500, {{"Anna"}});
    openPopup();
    press(button("button1"));
    ASSERT_TRUE(closes());
    EXPECT_FALSE(isOnScreen());
    EXPECT_EQ(log.messages().back(), "upload_data request id is not 0 app can't exit");
}

TEST_F(ConfirmationPopup, BackKeyClosesAndLeaves)
{
    is_noti_pressed = 1;
    share(1, 1500, {{"Anna"}});
    openPopup();
    pressKey("Escape");
    ASSERT_TRUE(closes());
    expectNothingLeft();
    EXPECT_EQ(is_noti_pressed, 0);
    EXPECT_EQ(log.messages().back(), "No upload_data request id exist so app is exiting");
}

TEST_F(ConfirmationPopup, BackKeyKeepsTheTapWhileTheShareIsFinished)
{
    is_noti_pressed = 1;
    share(1, 1500, {{"Anna"}});
    ad->upload_item->request_id = 9;
    UploadNotiData *node = addUploadNotiDataNode();
    node->request_id = 9;
    node->upload_status = 7;
    openPopup();
    pressKey("XF86Back");
    ASSERT_TRUE(closes());
    EXPECT_EQ(is_noti_pressed, 1);
    is_noti_pressed = 0;
}

TEST_F(ConfirmationPopup, ClosingTheWindowIsTheBackKey)
{
    contacts_connect();
    share(1, 1500, {});
    bypassContactView(ad);
    evas_object_smart_callback_call(ad->win, "delete,request", nullptr);
    expectNothingLeft();
    EXPECT_EQ(log.messages().back(), "No upload_data request id exist so app is exiting");
}

TEST_F(ConfirmationPopup, DeletedWindowTakesEverythingAlong)
{
    share(1, 1500, {{"Anna"}});
    openPopup();
    evas_object_del(ad->win);
    EXPECT_EQ(ad->win, nullptr);
    expectNothingLeft();
}

TEST_F(ConfirmationPopup, PopupAfterHidingIsVisibleAgain)
{
    _hideWindow(ad);
    EXPECT_FALSE(isOnScreen());
    share(1, 1500, {{"Anna"}});
    openPopup();
    EXPECT_TRUE(isOnScreen());
    press(button("button1"));
    EXPECT_TRUE(closes());
}

TEST_F(ConfirmationPopup, WithoutAShareTheNumberOfRecipientsStays)
{
    share(1, 1500, {{"Anna"}});
    _createPopupView(ad);
    freeUploadData(ad->upload_item);
    ad->upload_item = nullptr;
    log.restart();
    _createPopupView(ad);
    EXPECT_EQ(log.messages().front(), "ad->operation_type =4,g_total_recipients =1");
    EXPECT_EQ(body(), "");
}

TEST_F(ConfirmationPopup, NullRecordMeansTheApplicationsOwn)
{
    share(1, 1500, {{"Anna"}});
    log.restart();
    _createPopupView(nullptr);
    EXPECT_NE(ad->popup, nullptr);
    EXPECT_EQ(log.messages().front(), "ERROR : ad is NULL");
    bypassContactView(nullptr);
    EXPECT_EQ(log.messages().back(), "data is NULL");
}

} // namespace
} // namespace pelliko
