// What a share leaves behind at its end: files, the day's totals, the application itself.
#include "PellikoUploadDataManager/Recipients.h"
#include "UploadStatusScene.h"
#include "support/RefusingStore.h"

#include <filesystem>
#include <fstream>

namespace pelliko::test
{
namespace
{

TEST_F(UploadStatus, AShareThatOwesMessagesWaitsForThem)
{
    start();
    g_has_sms_receiver = 1;
    report(7);
    const std::string end = written();
    EXPECT_TRUE(end.ends_with(historyAbsent + "waiting for sending SMS\n" + popupNotMeant)) << end;
    EXPECT_FALSE(inList(7));
}

TEST_F(UploadStatus, TheEndOfOneUploadDoesNotLeaveWhileAnotherIsPending)
{
    start();
    addNode(8, {"/c"}, 1, "Ann?", "31?");
    report(7);
    const std::string end = written();
    EXPECT_TRUE(end.ends_with("Exit app, no need to wait sending SMS\n"
                              "upload_data request id is not 0 app can't exit\n"))
        << end;
    EXPECT_TRUE(inList(8));
}

TEST_F(UploadStatus, ShareFinishedWithAnErrorCountsNothing)
{
    start();
    report(7, 0, -5);
    EXPECT_EQ(totalSize(), 0);
    EXPECT_EQ(posted("7")->extras.at("upload_status"), "9");
}

TEST_F(UploadStatus, AFileMadeForTheShareIsRemovedAtItsEnd)
{
    const std::string memo = "/opt/usr/apps/com.velmora.pelliko/shared/data/memo.txt";
    std::ofstream(memo) << "memo";
    start(7, memo.c_str());
    report(7, 0, 0, memo.c_str());
    EXPECT_FALSE(std::filesystem::exists(memo));
    const std::string text = written();
    EXPECT_NE(text.find("Input_param is matched as temp file path\nRemove file success.\n"),
              std::string::npos)
        << text;
}

TEST_F(UploadStatus, TheUsersOwnFileIsLeftAlone)
{
    const std::string photo = "/tmp/photo.jpg";
    std::ofstream(photo) << "photo";
    start(7, photo.c_str());
    report(7, 0, 0, photo.c_str());
    EXPECT_TRUE(std::filesystem::exists(photo));
    EXPECT_EQ(written().find("Input_param"), std::string::npos);
}

TEST_F(UploadStatus, APathThatClimbsOutOfTheDirectoryIsLeftAlone)
{
    const std::string photo = "/opt/usr/apps/com.velmora.pelliko/shared/photo.jpg";
    std::ofstream(photo) << "photo";
    start();
    report(7, 0, 0, "/opt/usr/apps/com.velmora.pelliko/shared/data/../photo.jpg");
    EXPECT_TRUE(std::filesystem::exists(photo));
}

TEST_F(UploadStatus, ATempFileThatIsGoneAlreadyDoesNotStopTheShare)
{
    start();
    report(7, 0, 0, "/opt/usr/apps/com.velmora.pelliko/shared/data/gone.txt");
    const std::string text = written();
    EXPECT_NE(text.find("Remove file failed [-1]\n"), std::string::npos) << text;
    EXPECT_EQ(posted("7")->extras.at("upload_status"), "6");
}

TEST_F(UploadStatus, ThePeriodIsStampedAtItsFirstShareOnly)
{
    start(7);
    report(7);
    double first = 0.0;
    ASSERT_EQ(preference_get_double(shareTimeLastKey, &first), PREFERENCE_ERROR_NONE);
    EXPECT_NE(written().find("Updating preference for share_time_last"), std::string::npos);
    start(8);
    report(7, 0, 0, nullptr, 8);
    EXPECT_EQ(written().find("Updating preference for share_time_last"), std::string::npos);
    double second = 0.0;
    preference_get_double(shareTimeLastKey, &second);
    EXPECT_EQ(first, second);
    EXPECT_EQ(totalSize(), 4000);
}

TEST_F(UploadStatus, AStoreThatRefusesTheDaysTotalsDoesNotStopTheEnd)
{
    start();
    const RefusingStore full;
    report(7);
    const std::string text = std::regex_replace(written(), std::regex("p_err = -[0-9]+"), "p_err");
    EXPECT_NE(text.find(rowDeleted +
                        "Error in setting PREFERENCE KEY SHARE_TIME_LAST, p_err\n"
                        "Error in setting PREFERENCE KEY SHARE_TIME_LAST\n"
                        "Error in setting PREFERENCE KEY SHARE_TOTAL_SIZE, p_err\n"
                        "Error in setting PREFERENCE SHARE_TOTAL_SIZE with share_total_size = "
                        "2000.000000, p_err\n" +
                        historyAbsent),
              std::string::npos)
        << text;
    EXPECT_EQ(posted("7")->extras.at("upload_status"), "6");
    EXPECT_FALSE(inList(7));
}

TEST_F(UploadStatus, APeriodStartOfAnotherTypeIsStampedAnew)
{
    preference_set_int(shareTimeLastKey, 5);
    start();
    report(7);
    const std::string text = std::regex_replace(written(), std::regex("p_err = -[0-9]+"), "p_err");
    EXPECT_NE(text.find("Error in getting PREFERENCE KEY SHARE_TIME_LAST, p_err\n"
                        "Updating preference for share_time_last with value = now\n"),
              std::string::npos)
        << text;
}

TEST_F(UploadStatus, AReshareTellsItsNewRequestId)
{
    addNode(8, {}, 5000, "Ann?", "31?");
    ad->reshared_request_id = 8;
    log.restart();
    report(7, 0, 0, nullptr, 8);
    EXPECT_TRUE(log.has("request_id = 8, req_id = 8"));
}

TEST_F(UploadStatus, ANotificationThatWasSwipedAwayDoesNotStopTheEnd)
{
    start();
    report(2, 40);
    notification_delete_all(NOTIFICATION_TYPE_ONGOING);
    report(5);
    EXPECT_FALSE(inList(7));
    EXPECT_TRUE(rows().empty());
}

} // namespace
} // namespace pelliko::test
