// The text, the recipients and the ids to resume that a launch request carries.
#include "ShareRequestScene.h"
#include "support/PanelHistory.h"

#include <glib.h>
#include <gmock/gmock.h>
#include <sys/stat.h>

namespace pelliko
{
namespace
{

using test::LaunchRequest;
using test::ShareRequest;
using ::testing::ElementsAre;
using ::testing::MatchesRegex;

namespace fs = std::filesystem;

constexpr const char *deviceError =
    "IDS_RSH_BODY_UNABLE_TO_UPLOAD_FILES_A_DEVICE_ERROR_HAS_OCCURRED_ABB";
constexpr const char *exiting = "No upload_data request id exist so app is exiting";

std::string contentOf(const std::string &path)
{
    std::ifstream in(path);
    return {std::istreambuf_iterator<char>(in), {}};
}

std::string memo(PellikoAppData &ad, const std::string &text)
{
    char *path = _createTextUri(LaunchRequest().text(APP_CONTROL_DATA_TEXT, text), &ad);
    const std::string copy = path ? path : "(null)";
    g_free(path);
    return copy;
}

TEST_F(ShareRequest, TextBecomesAMemoFile)
{
    const std::string path = memo(ad, "Grüße 100%");
    EXPECT_THAT(path, MatchesRegex("/opt/usr/apps/com.velmora.pelliko/shared/data/"
                                   "memo_[0-9]{8}_[0-9]{6}.txt"));
    EXPECT_EQ(contentOf(path), "Grüße 100%");
    struct stat info = {};
    ASSERT_EQ(stat(path.c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 0777, 0644u);
    EXPECT_THAT(log.messages(), ElementsAre("memo = Grüße 100%", "MEMO URI = [" + path + "]"));
    fs::remove(path);
}

TEST_F(ShareRequest, SecondTextOfTheSameSecondOverwritesTheStartOfTheFirst)
{
    std::string first;
    std::string second;
    do {
        fs::remove(first);
        first = memo(ad, "a longer text");
        second = memo(ad, "THE");
    } while (first != second); // the second was over between the two
    EXPECT_EQ(contentOf(first), "THEonger text");
    fs::remove(first);
}

TEST_F(ShareRequest, RequestWithoutTextIsToldAndLeaves)
{
    // A memo of an earlier case in the same second would be taken for this one's.
    for (const auto &entry :
         fs::directory_iterator(std::string(test::applicationHome) + "/shared/data"))
        fs::remove(entry.path());
    EXPECT_EQ(_createTextUri(LaunchRequest(), &ad), nullptr);
    EXPECT_THAT(log.messages(),
                ElementsAre("memo = (null)", "Unsupported memo type. Exiting App.", exiting));
    EXPECT_EQ(test::toasts().back(), deviceError);
}

TEST_F(ShareRequest, MemoThatCannotBeWrittenIsToldAndLeaves)
{
    const std::string shared = std::string(test::applicationHome) + "/shared/data";
    fs::rename(shared, shared + ".away");
    EXPECT_EQ(memo(ad, "text"), "(null)");
    fs::rename(shared + ".away", shared);
    EXPECT_THAT(log.messages(), ElementsAre("memo = text", "fd open failed",
                                            "Unsupported memo type. Exiting App.", exiting));
}

TEST_F(ShareRequest, MemoOnAFullDiskIsToldAndLeaves)
{
    // Wherever the memo of these seconds goes, nothing can be written.
    std::vector<std::string> memos;
    for (const int later : {0, 1, 2, 3}) {
        const time_t then = time(nullptr) + later;
        struct tm local = {};
        localtime_r(&then, &local);
        char stamp[64];
        strftime(stamp, sizeof(stamp), "/shared/data/memo_%Y%m%d_%H%M%S.txt", &local);
        memos.push_back(test::applicationHome + std::string(stamp));
        fs::remove(memos.back());
        fs::create_symlink("/dev/full", memos.back());
    }
    EXPECT_EQ(memo(ad, "text"), "(null)");
    EXPECT_THAT(log.messages(), ElementsAre("memo = text", "fd write failed",
                                            "Unsupported memo type. Exiting App.", exiting));
    EXPECT_EQ(test::toasts().back(), deviceError);
    for (const std::string &path : memos)
        fs::remove(path);
}

// Recipients and ids to resume

TEST_F(ShareRequest, NumberIdEndsAtTheBar)
{
    _parseDataTo(&ad, LaunchRequest().array(APP_CONTROL_DATA_TO, {"1234|Ann|+44", "7", "|5", "x"}));
    EXPECT_EQ(ad.number_id_count, 4);
    EXPECT_THAT(log.messages(),
                ElementsAre("data/to array len = 4, ret = 0 ", "number_id_list[0]=1234",
                            "number_id_list[1]=7", "number_id_list[2]=0", "number_id_list[3]=0"));
    EXPECT_EQ(ad.number_id_list[0], 1234);
    EXPECT_EQ(ad.number_id_list[1], 7);
}

TEST_F(ShareRequest, NumberIdsBeyondTenAreCountedButNotKept)
{
    const std::vector<std::string> ids(5000, "8");
    _parseDataTo(&ad, LaunchRequest().array(APP_CONTROL_DATA_TO, ids));
    EXPECT_EQ(ad.number_id_count, 5000);
    EXPECT_EQ(ad.number_id_list[9], 8);
    EXPECT_EQ(log.messages().size(), 11u);
    EXPECT_EQ(ad.has_upload_resume, 0);
}

TEST_F(ShareRequest, RequestWithoutRecipientsKeepsTheEarlierOnes)
{
    _parseDataTo(&ad, LaunchRequest().array(APP_CONTROL_DATA_TO, {"1", "2"}));
    _parseDataTo(&ad, LaunchRequest());
    EXPECT_EQ(ad.number_id_count, 2);
    EXPECT_EQ(ad.number_id_list[1], 2);
    _parseDataTo(&ad, LaunchRequest().array(APP_CONTROL_DATA_TO, {"3"}));
    EXPECT_EQ(ad.number_id_count, 1);
    EXPECT_EQ(ad.number_id_list[1], 0);
}

TEST_F(ShareRequest, IdsToResumeAreKeptUpToAHundred)
{
    std::vector<std::string> ids(150, "9");
    ids[0] = "11";
    _parseUploadResume(&ad, LaunchRequest().array("upload_resume", ids));
    EXPECT_EQ(ad.has_upload_resume, 1);
    EXPECT_EQ(ad.upload_resume_count, 150);
    EXPECT_EQ(ad.upload_resume_id_list[0], 11);
    EXPECT_EQ(ad.upload_resume_id_list[99], 9);
    EXPECT_EQ(ad.rotation, 0);
    EXPECT_THAT(log.messages()[0], "data/to array len = 150, ret = 0 ");
    EXPECT_THAT(log.messages()[1], "upload_resume_id_list[0]=11");
    EXPECT_EQ(log.messages().size(), 101u);
}

TEST_F(ShareRequest, LaunchWithoutIdsHasNothingToResume)
{
    _parseUploadResume(&ad, LaunchRequest().array("upload_resume", {"11"}));
    _parseUploadResume(&ad, LaunchRequest());
    EXPECT_EQ(ad.has_upload_resume, 0);
    EXPECT_EQ(ad.upload_resume_count, 1);
}

} // namespace
} // namespace pelliko
