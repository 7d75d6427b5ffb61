// What the popup shows: the tapped state, and each report after it.
#include "PellikoUploadDataManager/ConfirmationPopup.h"
#include "PellikoUploadingDataManager/StatusPopupScene.h"
#include "PellikoUploadingDataManager/StatusRecipients.h"
#include "support/LaunchRequest.h"

#include <gmock/gmock.h>

namespace pelliko::test
{
namespace
{

using ::testing::Contains;
using ::testing::Not;
using ::testing::StartsWith;

constexpr const char *quits = "No upload_data request id exist so app is exiting";

TEST_F(StatusPopup, SendingToOneShowsBarSizeAndCancel)
{
    pending(45);
    log.restart();
    tap({.recipients = {"Ann+SMS"}, .files = 1, .bytes = 1572864});
    EXPECT_THAT(log.messages(), Contains("Uploading noti pressed"));
    EXPECT_THAT(log.messages(), Contains("Setting popup_share_view_single"));
    EXPECT_THAT(log.messages(), Contains("Noti press popup for = 3"));
    EXPECT_STREQ(elm_object_part_text_get(ad->popup, "title,text"), "Share files");
    EXPECT_EQ(statusLine(), "Sending…");
    EXPECT_EQ(sizeLine(), "1 file (1.50 MB)");
    EXPECT_DOUBLE_EQ(bar(), 0.45);
    EXPECT_STREQ(elm_object_text_get(ad->cancel_button), "Cancel");
    EXPECT_STREQ(elm_object_text_get(okButton()), "OK");
    EXPECT_EQ(evas_object_data_get(ad->popup, "progressbar"), ad->progressbar);
    EXPECT_EQ(popup_update_enabled, 1);
    EXPECT_TRUE(isOnScreen());
}

TEST_F(StatusPopup, SeveralRecipientsHaveAHeadingAndBadges)
{
    log.restart();
    launch({.state = NOTI_STATE_PREPARING, .recipients = {"Ann+SMS", "Bo", "SMS +SMS x"}});
    EXPECT_EQ(heading(), "Recipients (3)");
    const auto lines = log.messages();
    EXPECT_THAT(lines, Contains("Setting popup_share_view_multiple"));
    EXPECT_THAT(lines, Contains("TOTAL RECEPIENTS:[3]"));
    EXPECT_THAT(lines, Contains("recipient = Ann+SMS"));
    EXPECT_THAT(lines, Contains("Setting SMS badge.").Times(1));
    EXPECT_EQ(bar(), 0.0);
    EXPECT_EQ(ad->cancel_button, nullptr);
}

TEST_F(StatusPopup, MarkOfAnSmsRecipientStandsAtTheEnd)
{
    EXPECT_TRUE(_checkSmsReceiver("Ann+SMS"));
    EXPECT_FALSE(_checkSmsReceiver("Ann"));
    EXPECT_FALSE(_checkSmsReceiver("Ann+SMS "));
    EXPECT_FALSE(_checkSmsReceiver(""));
}

TEST_F(StatusPopup, StateThatNobodyKnowsShowsNothingButOk)
{
    for (const int state : {7, 42, -1, INT32_MIN}) {
        log.restart();
        tap({.state = state});
        EXPECT_THAT(log.messages(), Not(Contains(StartsWith("Setting "))));
        EXPECT_THAT(log.messages(), Contains("Noti press popup for = " + std::to_string(state)));
        EXPECT_EQ(ad->progressbar, nullptr);
        updatePopupStatus(2, 50, 0);
        updatePopupStatus(7, 0, 0);
        press(okButton());
        ASSERT_TRUE(closes());
        EXPECT_EQ(log.messages().back(), quits);
    }
}

TEST_F(StatusPopup, SizesArePrintedInTheirUnit)
{
    const std::pair<int, const char *> sizes[] = {
        {1023, "3 files (1023.00 B)"},     {1024, "3 files (1.00 KB)"},
        {1572864, "3 files (1.50 MB)"},    {INT32_MAX, "3 files (2.00 GB)"},
        {1048575, "3 files (1024.00 KB)"},
    };
    for (const auto &[bytes, line] : sizes) {
        launch({.bytes = bytes});
        EXPECT_EQ(sizeLine(), line);
    }
    for (const int bytes : {0, -5}) {
        launch({.bytes = bytes});
        EXPECT_EQ(sizeLine(), "");
    }
}

TEST_F(StatusPopup, OnlyAnUploadWithABarIsAskedForItsProgress)
{
    pending(45);
    const std::pair<int, int> lookups[] = {{0, 0}, {1, 1}, {2, 1}, {3, 1}, {5, 0}, {6, 0}};
    for (const auto &[state, times] : lookups) {
        log.restart();
        launch({.state = state});
        EXPECT_THAT(log.messages(), Contains("Request id found = 7").Times(times)) << state;
    }
}

TEST_F(StatusPopup, FirstProgressBringsTheButtonAndTheSendingLine)
{
    launch({.state = NOTI_STATE_PREPARING});
    updatePopupStatus(1, 0, 0);
    EXPECT_EQ(statusLine(), "Preparing to send files…");
    updatePopupStatus(2, 0.0, 0);
    EXPECT_EQ(statusLine(), "Preparing to send files…");
    EXPECT_EQ(ad->cancel_button, nullptr);
    updatePopupStatus(2, 12, 0);
    EXPECT_EQ(statusLine(), "Sending…");
    EXPECT_EQ(sizeLine(), "3 files (5.00 MB)");
    EXPECT_NE(ad->cancel_button, nullptr);
    EXPECT_EQ(bar(), 0.0);
    log.restart();
    updatePopupStatus(2, 37.5, 0);
    EXPECT_DOUBLE_EQ(bar(), 0.375);
    EXPECT_EQ(log.messages().back(), "Updating progress on progressbar = 37.500000");
    EXPECT_EQ(statusLine(), "Sending…");
    updatePopupStatus(2, 100, 0);
    EXPECT_DOUBLE_EQ(bar(), 0.375);
}

TEST_F(StatusPopup, PauseIsShownAndTheNextProgressGoesOn)
{
    launch({});
    updatePopupStatus(6, 0, 0);
    EXPECT_EQ(log.messages().back(), "default case...");
    EXPECT_EQ(statusLine(), "Sending paused");
    updatePopupStatus(2, 50, 0);
    EXPECT_EQ(statusLine(), "Sending…");
    updatePopupStatus(2, 51, 0);
    EXPECT_DOUBLE_EQ(bar(), 0.51);
}

TEST_F(StatusPopup, FinishedFilesAreFollowedByTheRecipients)
{
    launch({});
    updatePopupStatus(3, 100, 0);
    EXPECT_EQ(statusLine(), "Notifying recipients…");
    EXPECT_EQ(g_noti_press_data.upload_status, NOTI_STATE_SENT);
    expectNoBarAndButton();
    speak("de_DE.UTF-8");
    EXPECT_EQ(statusLine(), "Dateien gesendet");
    speak("en_GB.UTF-8");
    updatePopupStatus(7, 0, 0);
    EXPECT_EQ(statusLine(), "Files sent");
    EXPECT_EQ(g_noti_press_data.upload_status, NOTI_STATE_SENT);
}

TEST_F(StatusPopup, FailureNamesTheServerOrTheDevice)
{
    for (const int error : {-16, -7, -4}) {
        launch({});
        updatePopupStatus(4, 0, error);
        EXPECT_EQ(statusLine(), "A server error has occurred while sending files.");
        EXPECT_EQ(g_noti_press_data.upload_status, NOTI_STATE_FAILED_SERVER);
        expectNoBarAndButton();
    }
    for (const int error : {-18, -5, 1}) {
        launch({});
        updatePopupStatus(4, 0, error);
        EXPECT_EQ(statusLine(), "Some files have been moved, deleted or renamed while being sent.");
        EXPECT_EQ(g_noti_press_data.upload_status, NOTI_STATE_FAILED_DEVICE);
        expectNoBarAndButton();
    }
}

TEST_F(StatusPopup, EndOfTheShareDoesNotHideACancel)
{
    launch({});
    updatePopupStatus(5, 0, 0);
    EXPECT_EQ(statusLine(), "Sending has been cancelled.");
    EXPECT_EQ(g_noti_press_data.upload_status, NOTI_STATE_CANCELLED);
    expectNoBarAndButton();
    updatePopupStatus(7, 0, 0);
    EXPECT_EQ(statusLine(), "Sending has been cancelled.");
    launch({});
    updatePopupStatus(7, 0, 0);
    EXPECT_EQ(statusLine(), "Files sent");
    EXPECT_EQ(g_noti_press_data.upload_status, NOTI_STATE_SENDING);
    expectNoBarAndButton();
}

TEST_F(StatusPopup, ReportsReachNoPopupThatIsNotItsOwn)
{
    launch({});
    popup_update_enabled = 0;
    updatePopupStatus(5, 0, 0);
    EXPECT_EQ(statusLine(), "Sending…");
    popup_update_enabled = 1;
    share(1, 1500, {{"Ann"}});
    _createPopupView(ad);
    updatePopupStatus(2, 50, 0);
    EXPECT_EQ(ad->cancel_button, nullptr);
    EXPECT_EQ(layoutText("elm.text"), "Share via Wi-Fi only");
    evas_object_del(ad->popup);
    updatePopupStatus(5, 0, 0);
    EXPECT_EQ(g_noti_press_data.upload_status, NOTI_STATE_SENDING);
}

TEST_F(StatusPopup, EndOfAnotherUploadChangesNothing)
{
    pending(10, 7);
    pending(10, 8);
    pending(10, 9);
    launch({});
    report(5, 0, 0, 8);
    report(2, 20, -16, 9);
    ASSERT_TRUE(waitUntil([this] {
        const auto lines = log.messages();
        return std::count(lines.begin(), lines.end(), "update_popup_data = 4+0.000000+-16") == 2;
    }));
    EXPECT_EQ(statusLine(), "Sending…");
    EXPECT_NE(ad->cancel_button, nullptr);
    report(5);
    EXPECT_TRUE(waitUntil([this] { return statusLine() == "Sending has been cancelled."; }));
}

TEST_F(StatusPopup, ProgressOfItsUploadMovesTheBar)
{
    pending(10);
    launch({});
    report(2, 45);
    EXPECT_TRUE(waitUntil([this] { return bar() == 0.45; }));
    report(2, 46, -7);
    EXPECT_TRUE(waitUntil([this] { return statusLine().starts_with("A server error"); }));
    EXPECT_NE(ad->popup, nullptr);
    EXPECT_THAT(log.messages(), Contains("Popup is open.. can't exit"));
}

TEST_F(StatusPopup, RotationKeepsWhatTheReportsHaveChanged)
{
    launch({.state = NOTI_STATE_PREPARING});
    updatePopupStatus(2, 12, 0);
    const Evas_Object *popup = ad->popup;
    evas_object_smart_callback_call(ad->win, "wm,rotation,changed", nullptr);
    EXPECT_EQ(ad->popup, popup);
    EXPECT_EQ(statusLine(), "Sending…");
}

TEST_F(StatusPopup, LanguageChangesEveryTextOfOne)
{
    tap({.files = 1, .bytes = 1572864});
    speak("de_DE.UTF-8");
    EXPECT_STREQ(elm_object_part_text_get(ad->popup, "title,text"), "Dateien teilen");
    EXPECT_EQ(statusLine(), "Wird gesendet …");
    EXPECT_EQ(sizeLine(), "1 Datei (1,50 MB)");
    EXPECT_STREQ(elm_object_text_get(ad->cancel_button), "Abbrechen");
    EXPECT_STREQ(elm_object_text_get(okButton()), "OK");
    ASSERT_TRUE(settle(ad->cancel_button));
    picture = "status-german";
}

TEST_F(StatusPopup, LanguageChangesEveryTextOfSeveral)
{
    tap({.state = 9, .recipients = {"Ann", "Bo+SMS"}});
    speak("de_DE.UTF-8");
    EXPECT_EQ(heading(), "Empfänger (2)");
    EXPECT_EQ(statusLine(), "Einige Dateien wurden während des Sendens verschoben, gelöscht oder "
                            "umbenannt.");
    ASSERT_TRUE(settle(okButton()));
    picture = "status-german-several";
}

TEST_F(StatusPopup, LanguageChangeWritesNoLineWithoutAState)
{
    launch({});
    const LaunchRequest untold;
    getUploadData(untold);
    speak("de_DE.UTF-8");
    EXPECT_EQ(statusLine(), "Sending…");
}

} // namespace
} // namespace pelliko::test
