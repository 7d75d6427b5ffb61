// What each report of the service changes and writes while a share is on its way.
#include "PellikoUploadingDataManager/PressedNotification.h"
#include "UploadStatusScene.h"

#include <glib.h>
#include <pelliko_client.h>

namespace pelliko::test
{
namespace
{

// Pieces that many reports write, for request 7 with one recipient and one file of 2000 bytes.

std::string head(int status, int error_code, int percent)
{
    return "Request id found = 7\n"
           "Status : " +
           std::to_string(status) + ", error_code : " + std::to_string(error_code) +
           ", req_id : 7\n"
           "Percentage : " +
           std::to_string(percent) +
           "\n"
           "expired_time : 0\n";
}

const std::string deleted = "noti_id = 7\n"
                            "************* Removing Noti = 7*******************\n";

std::string absentKeys()
{
    std::string all;
    for (int i = 0; i < 6; ++i)
        all += "app control error recieved = -126\n";
    return all;
}

std::string figures(int state)
{
    return "Populating extra data from current node...\n"
           "Adding total recipients = 1\n"
           "Adding recipient index list to extra data. list = 31?\n"
           "Adding recipient list to extra data. list = Ann?\n"
           "Adding total files = 1\n"
           "Adding status = " +
           std::to_string(state) +
           "\n"
           "Adding request id = 7\n"
           "Adding total size = 2000\n";
}

const std::string inserted = "Populating tag from current node...\n"
                             "Request id found = 7\n"
                             "node->noti_priv_id = 7\n";

std::string sending(const std::string &percent, const std::string &part)
{
    return "Updating = %p\n"
           "Uploading stage is preparing or paused\n" +
           deleted + "Adding sending noti...\n" + absentKeys() + figures(3) + inserted +
           "progress_percent = " + percent +
           "\n"
           "Updating progress on notification = 7 with percent = " +
           part + "\n" + popupNotMeant;
}

std::string handOver(const std::string &status, const std::string &error)
{
    return "status = " + status + ", progress_percent = 0.000000, error_code = " + error +
           "\n"
           "previous update_popup_data = \n"
           "new update_popup_data = " +
           status + "+0.000000+" + error +
           "\n"
           "PREFERENCE KEY SHARE_UPDATE_POPUP_DATA updated.\n";
}

const std::string leaving = "No upload_data request id exist so app is exiting\n";

TEST_F(UploadStatus, AShareGoesFromStartedToSent)
{
    start();
    report(1);
    EXPECT_EQ(written(), head(1, 0, 0) + "Uploads Started...\n" + sending("0", "0.000000"));
    EXPECT_EQ(posted("7")->layout, NOTIFICATION_LY_ONGOING_PROGRESS);

    report(2, 40);
    EXPECT_EQ(written(), head(2, 0, 40) +
                             "Updating = %p\n"
                             "progress_percent = 40\n"
                             "Updating progress on notification = 7 with percent = "
                             "0.400000\n" +
                             popupNotMeant);

    report(3);
    EXPECT_EQ(written(),
              head(3, 0, 0) + "Upload Finished...\n" + deleted +
                  "Updating notification with text <Sending notifications to recipients...>\n" +
                  figures(5) + inserted + popupNotMeant);
    EXPECT_EQ(posted("7")->extras.at("upload_status"), "5");
    EXPECT_EQ(rows(), (std::vector<int>{7}));

    report(7);
    EXPECT_EQ(written(), head(7, 0, 0) +
                             "noti_id = 7\n"
                             "Notification is null, returning\n"
                             "Upload Complete. Updating notification\n" +
                             absentKeys() + figures(6) + inserted + rowDeleted +
                             "Updating preference for share_time_last with value = now\n"
                             "Updating preference for share_total_size with value = 2000\n" +
                             historyAbsent + "Exit app, no need to wait sending SMS\n" + leaving);
    EXPECT_EQ(posted("7")->type, NOTIFICATION_TYPE_NOTI);
    EXPECT_EQ(posted("7")->extras.at("upload_status"), "6");
    EXPECT_TRUE(rows().empty());
    EXPECT_FALSE(inList(7));
}

TEST_F(UploadStatus, MessagesBeforeTheEndLetTheEndLeave)
{
    UploadNotiData *node = start();
    report(3);
    ad->req_id = g_strdup("7");
    ad->operation_type = OPERATION_SEND_SMS;
    written();
    updatePreference();
    ASSERT_TRUE(loop.runUntil([node] { return node->completion_flag == 1; }));
    EXPECT_EQ(written(), "Updating preference for sms_done with value = 1\n"
                         "req_id = 7\n"
                         "Request id found = 7\n"
                         "upload_data request id is not 0 app can't exit\n");

    report(7);
    const std::string end = written();
    EXPECT_TRUE(end.ends_with(historyAbsent +
                              "Updating preference for sms_done with value = 1\n"
                              "waiting for sending SMS under SMS operation\n" +
                              popupNotMeant))
        << end;
    ASSERT_TRUE(loop.runUntil([this] { return log.messages().size() >= 2; }));
    EXPECT_EQ(written(), "req_id = 7\n" + leaving);
}

TEST_F(UploadStatus, AnOpenPopupKeepsTheApplicationAndGetsTheEnd)
{
    start();
    int popup = 0;
    ad->popup = reinterpret_cast<Evas_Object *>(&popup); // only its presence counts
    popup_update_enabled = 1;
    g_noti_press_data.upload_request_id = 7;
    preference_set_string(updatePopupDataKey, "");
    report(7);
    const std::string end = written();
    EXPECT_TRUE(end.ends_with(historyAbsent +
                              "req_id = 7 and g_noti_press_data.upload_request_id = 7\n" +
                              handOver("7", "0")))
        << end;
    EXPECT_NE(ad->popup, nullptr);
    ad->popup = nullptr;
}

TEST_F(UploadStatus, ProgressReachesOnlyThePopupOfItsOwnUpload)
{
    start();
    int popup = 0;
    ad->popup = reinterpret_cast<Evas_Object *>(&popup);
    popup_update_enabled = 1;
    g_noti_press_data.upload_request_id = 8;
    report(2, 45);
    EXPECT_EQ(written().find("new update_popup_data"), std::string::npos);
    g_noti_press_data.upload_request_id = 7;
    popup_update_enabled = 0;
    report(2, 46);
    EXPECT_EQ(written().find("new update_popup_data"), std::string::npos);
    popup_update_enabled = 1;
    report(2, 47);
    EXPECT_NE(written().find("new update_popup_data = 2+47.000000+0\n"), std::string::npos);
    ad->popup = nullptr;
}

TEST_F(UploadStatus, TheSamePercentTwiceChangesNothing)
{
    start();
    report(2, 40);
    written();
    report(2, 40);
    EXPECT_EQ(written(), head(2, 0, 40) + "Same progress_percent. Returning...\n");
}

TEST_F(UploadStatus, AFirstReportOfZeroPercentIsDropped)
{
    start();
    report(2, 0);
    EXPECT_EQ(written(), head(2, 0, 0) + "Same progress_percent. Returning...\n");
}

TEST_F(UploadStatus, APauseIsShownOnceAndProgressShowsSendingAgain)
{
    start();
    report(2, 40);
    written();
    report(6);
    EXPECT_EQ(written(), head(6, 0, 0) + "Upload Paused...\n" + deleted +
                             "Updating notification with text <Uploading Paused>\n" + absentKeys() +
                             figures(1) + inserted + "_notificationInsert success\n");
    report(6);
    EXPECT_EQ(written(), head(6, 0, 0) + "Upload Paused...\nAlready Paused.. returning\n");
    report(2, 40);
    EXPECT_EQ(written(), head(2, 0, 40) + "Same progress_percent. Returning...\n");
    report(2, 41);
    EXPECT_EQ(written(), head(2, 0, 41) + sending("41", "0.410000"));
    EXPECT_EQ(rows(), (std::vector<int>{7}));
}

TEST_F(UploadStatus, AnErrorEndsTheRequest)
{
    start();
    preference_set_string(updatePopupDataKey, "");
    report(2, 40, -16);
    EXPECT_EQ(written(),
              head(2, -16, 40) + rowDeleted + "Remote Share Upload error err - -16\n\n" + deleted +
                  "Updating notification with text <IDS_RSH_TMBODY_FAILED_TO_SEND_FILES_ABB>\n" +
                  figures(8) + inserted + handOver("4", "-16") + leaving +
                  "Ongoing uploads. Can't exit.\n");
    EXPECT_FALSE(inList(7));
    EXPECT_TRUE(rows().empty());
    EXPECT_EQ(posted("7")->extras.at("upload_status"), "8");
}

TEST_F(UploadStatus, ProgressWithAnErrorIsAFailure)
{
    start();
    report(2, 40, 5);
    EXPECT_TRUE(rows().empty());
    EXPECT_FALSE(inList(7));
    EXPECT_EQ(posted("7")->extras.at("upload_status"), "9");
    EXPECT_EQ(written().find("Updating = "), std::string::npos);
}

TEST_F(UploadStatus, ACancelledRequestIsGoneWithoutAskingTheExitRule)
{
    start();
    report(2, 40);
    written();
    preference_set_string(updatePopupDataKey, "");
    report(5);
    EXPECT_EQ(written(), head(5, 0, 0) + "File uploading cancelled...\n" + deleted +
                             handOver("5", "0") + rowDeleted);
    EXPECT_FALSE(posted("7"));
    EXPECT_FALSE(inList(7));
    EXPECT_TRUE(rows().empty());
}

TEST_F(UploadStatus, ProgressAfterCancelWasPressedNoLongerMovesTheBar)
{
    start();
    report(2, 40);
    g_cancel_in_progress = 1;
    written();
    report(2, 60);
    EXPECT_EQ(written(), head(2, 0, 60));
    EXPECT_DOUBLE_EQ(posted("7")->progress, 0.4);
}

TEST_F(UploadStatus, AReportForAnUnknownRequestIsIgnored)
{
    start();
    report(3, 0, 0, nullptr, 99);
    EXPECT_EQ(written(), "request id not found\n");
    EXPECT_TRUE(inList(7));
    report(7, 0, -4, nullptr, 99);
    EXPECT_EQ(rows(), (std::vector<int>{7}));
}

TEST_F(UploadStatus, AReportWithoutTheRecordIsIgnored)
{
    uploadResponseStatusCb(2, nullptr, 1, 0, 0, 0, 7, nullptr);
    EXPECT_EQ(written(), "[ERROR][(user_data == NULL)] Return message : user_data is NULL\n");
}

TEST_F(UploadStatus, StatusesWithoutAStepOfTheirOwnKeepTheUploadAndRefreshIt)
{
    for (const int status : {4, 0, 99}) {
        start();
        report(status, 30);
        EXPECT_EQ(written(), head(status, 0, 30) + sending("0", "0.000000"));
        EXPECT_EQ(posted("7")->extras.at("upload_status"), "3");
        EXPECT_TRUE(inList(7));
        EXPECT_EQ(rows(), (std::vector<int>{7}));
        report(5);
        written();
    }
}

TEST_F(UploadStatus, AnExpiryBeyondThirtyTwoBitsIsLoggedWhole)
{
    start();
    uploadResponseStatusCb(1, nullptr, 0, 5000000000, 0, 0, 7, ad);
    EXPECT_TRUE(log.has("expired_time : 5000000000")) << log.text();
}

} // namespace
} // namespace pelliko::test
