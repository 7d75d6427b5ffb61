#include "PellikoApp/ShareRequest.h"
#include "support/FileLog.h"
#include "support/LaunchRequest.h"
#include "support/PanelHistory.h"
#include "support/UsageRecords.h"

#include <Ecore.h>
#include <filesystem>
#include <glib.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

namespace pelliko
{
namespace
{

namespace fs = std::filesystem;
using test::FileLog;
using test::LaunchRequest;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::MatchesRegex;
using ::testing::Not;
using ::testing::StartsWith;

constexpr const char *typeNotSupported = "IDS_RSH_TPOP_CANT_SHARE_FILES_FILE_TYPE_NOT_SUPPORTED";
constexpr const char *deviceError =
    "IDS_RSH_BODY_UNABLE_TO_UPLOAD_FILES_A_DEVICE_ERROR_HAS_OCCURRED_ABB";
constexpr const char *exiting = "No upload_data request id exist so app is exiting";
constexpr const char *reason = "reject_reason: not_supported_files";
constexpr const char *refused =
    "type: 0, feature: PK07 [Pelliko_Share_reject], extra: not_supported_files, value: (null)";
const std::string keyNotFound = std::to_string(APP_CONTROL_ERROR_KEY_NOT_FOUND);

class ShareRequest : public ::testing::Test
{
protected:
    static void SetUpTestSuite() { ecore_init(); }
    static void TearDownTestSuite() { ecore_shutdown(); }

    ShareRequest()
    {
        fs::create_directory(folder);
        unsupported_file_count = 99;
    }
    ~ShareRequest() override
    {
        freeUploadData(ad.upload_item);
        ad.upload_item = nullptr;
        fs::remove_all(folder);
    }

    // A file of that many bytes; its path.
    std::string file(const std::string &name, int64_t size = 100)
    {
        const std::string path = folder + "/" + name;
        std::ofstream out(path);
        out.close();
        fs::resize_file(path, static_cast<uintmax_t>(size));
        return path;
    }

    std::vector<std::string> files() const
    {
        std::vector<std::string> paths;
        for (const Eina_List *at = ad.upload_item->files; at; at = at->next)
            paths.emplace_back(static_cast<const char *>(at->data));
        return paths;
    }

    int single(const std::string &uri)
    {
        return _parseSingleDataPath(uri.c_str(), &ad, LaunchRequest());
    }

    int multiple(const std::vector<std::string> &paths)
    {
        return _parseMultipleDataPath(LaunchRequest().array(APP_CONTROL_DATA_PATH, paths), &ad);
    }

    const std::string folder = "/tmp/share-request";
    PellikoAppData ad;
    FileLog log;
    const test::UsageRecords usage;
};

// One file

TEST_F(ShareRequest, PlainPathIsTheShare)
{
    const std::string path = file("a.jpg", 2000);
    EXPECT_EQ(single(path), 0);
    EXPECT_THAT(files(), ElementsAre(path));
    EXPECT_EQ(ad.upload_item->files_count, 1);
    EXPECT_EQ(ad.upload_item->files_size, 2000);
    EXPECT_EQ(unsupported_file_count, 0);
    EXPECT_THAT(log.messages(),
                ElementsAre("extension[jpg], match[jpg]",
                            "Upload item: file_count = 1, files_size = 2000, before_files_size = "
                            "2000"));
}

TEST_F(ShareRequest, FileUriIsTheShareWithoutItsScheme)
{
    const std::string path = file("a.jpg", 2000);
    EXPECT_EQ(single("file://" + path), 0);
    EXPECT_THAT(files(), ElementsAre(path));
    EXPECT_THAT(log.messages(),
                ElementsAre("extension[jpg], match[jpg]", "files_list exists, count = 1",
                            "Upload item: file_count = 1, files_size = 2000, before_files_size = "
                            "2000"));
}

TEST_F(ShareRequest, PathOfAFileUriKeepsItsColons)
{
    EXPECT_EQ(single("file:///a:b.txt"), 0);
    EXPECT_THAT(files(), ElementsAre("/a:b.txt"));
}

TEST_F(ShareRequest, UnsupportedTypeIsToldAndLeaves)
{
    EXPECT_EQ(single("file://" + file("a.zip")), -1);
    EXPECT_THAT(files(), IsEmpty());
    EXPECT_THAT(log.messages(),
                ElementsAre("Unsupported file type. Exiting App.", reason, refused, exiting));
    EXPECT_THAT(usage.features(), ElementsAre("PK07 not_supported_files"));
    EXPECT_EQ(test::toasts().back(), typeNotSupported);
}

TEST_F(ShareRequest, FileOfNoBytesIsAcceptedAlone)
{
    EXPECT_EQ(single(file("empty.txt", 0)), 0);
    EXPECT_EQ(ad.upload_item->files_count, 1);
    EXPECT_EQ(ad.upload_item->files_size, 0);
}

TEST_F(ShareRequest, MissingFileCountsAsNoBytes)
{
    EXPECT_EQ(single("/no/such/file.txt"), 0);
    EXPECT_EQ(ad.upload_item->files_size, 0);
}

TEST_F(ShareRequest, TextThatIsNoPathIsRefusedWithoutLeaving)
{
    const size_t toasts = test::toasts().size();
    EXPECT_EQ(single("a.jpg"), -1);
    EXPECT_THAT(log.messages(), ElementsAre("extension[jpg], match[jpg]", "files list empty"));
    EXPECT_EQ(test::toasts().size(), toasts);
}

TEST_F(ShareRequest, SchemeWithoutARealPathGivesNoFile)
{
    EXPECT_EQ(single("file:/x.jpg"), 0); // two characters are taken for slashes
    EXPECT_THAT(files(), ElementsAre(".jpg"));
    log.restart();
    _parseFileUri(&ad, LaunchRequest(), "file:/x");
    _parseFileUri(&ad, LaunchRequest(), "file:");
    _parseFileUri(&ad, LaunchRequest(), "file");
    EXPECT_THAT(log.messages(),
                ElementsAre("len is less than 0 !!", "len is less than 0 !!", "scheme is NULL"));
    EXPECT_THAT(files(), ElementsAre(".jpg"));
}

TEST_F(ShareRequest, LongPathIsCutAt1024Bytes)
{
    ASSERT_EQ(single("file:///" + std::string(2000, 'x') + ".jpg"), 0);
    ASSERT_EQ(files().size(), 1u);
    EXPECT_EQ(files()[0].size(), 1024u);
}

TEST_F(ShareRequest, NewSingleShareReplacesTheOneBefore)
{
    ASSERT_EQ(single(file("a.jpg")), 0);
    const std::string second = file("b.jpg", 5);
    ASSERT_EQ(single(second), 0);
    EXPECT_THAT(files(), ElementsAre(second));
    EXPECT_EQ(ad.upload_item->before_files_size, 5u);
}

TEST_F(ShareRequest, MissingArgumentsAreRefused)
{
    EXPECT_EQ(_parseSingleDataPath(nullptr, &ad, nullptr), -1);
    EXPECT_EQ(unsupported_file_count, 0);
    _parseFileUri(nullptr, nullptr, "file:///a");
    _parseFileUri(&ad, nullptr, nullptr);
    EXPECT_EQ(_getFileSize(nullptr), -1);
    EXPECT_THAT(log.messages(),
                ElementsAre("[ERROR][(uri == NULL)] Return value : -1, message : uri is NULL",
                            "[ERROR][(ad == NULL)] Return message : ad is NULL",
                            "[ERROR][(uri == NULL)] Return message : uri is NULL",
                            "[ERROR][(path == NULL)] Return value : -1, message : path is NULL"));
    EXPECT_EQ(ad.upload_item, nullptr);
}

TEST_F(ShareRequest, SizeOfALargeFileWrapsInOneSumOnly)
{
    constexpr int64_t threeGib = int64_t{3} << 30;
    ASSERT_EQ(single(file("film.mp4", threeGib)), 0);
    EXPECT_EQ(ad.upload_item->files_size, -1073741824);
    EXPECT_EQ(ad.upload_item->before_files_size, static_cast<uint64_t>(threeGib));
    EXPECT_EQ(log.messages().back(), "Upload item: file_count = 1, files_size = -1073741824, "
                                     "before_files_size = 3221225472");
}

// Several files

TEST_F(ShareRequest, SeveralPathsKeepTheirOrder)
{
    const std::string a = file("a.jpg", 10);
    const std::string b = file("b.pdf", 20);
    EXPECT_EQ(multiple({b, a}), 0);
    EXPECT_THAT(files(), ElementsAre(b, a));
    EXPECT_THAT(log.messages(),
                ElementsAre("array len = 2, ret = 0 ", "extension[pdf], match[pdf]",
                            "extension[jpg], match[jpg]", "Total unsupported files are = 0",
                            "Upload item: file_count = 2, files_size = 30, prepare_files_size = "
                            "30"));
}

TEST_F(ShareRequest, UnsupportedAndEmptyFilesOfAListAreLeftOutAndCounted)
{
    const std::string good = file("a.jpg");
    EXPECT_EQ(multiple({file("a.zip"), good, file("empty.txt", 0), "relative.jpg"}), 0);
    EXPECT_THAT(files(), ElementsAre(good));
    EXPECT_EQ(unsupported_file_count, 2);
    EXPECT_THAT(log.messages(), Contains("Total unsupported files are = 2"));
}

TEST_F(ShareRequest, FileUriInAListIsTakenWhateverItsTypeAndSize)
{
    const std::string path = file("a.zip", 0);
    EXPECT_EQ(multiple({"file://" + path}), 0);
    EXPECT_THAT(files(), ElementsAre(path));
    EXPECT_EQ(unsupported_file_count, 0);
}

TEST_F(ShareRequest, ListWithoutAnySupportedFileIsToldAndLeaves)
{
    EXPECT_EQ(multiple({file("a.zip")}), -1);
    EXPECT_THAT(log.messages(),
                ElementsAre("array len = 1, ret = 0 ", "Total unsupported files are = 1",
                            "files list empty", "All files are unsupported. Exiting App.", reason,
                            refused, exiting));
    EXPECT_THAT(usage.features(), ElementsAre("PK07 not_supported_files"));
    EXPECT_EQ(test::toasts().back(), typeNotSupported);
}

TEST_F(ShareRequest, RequestWithoutPathsSucceedsWithWhatIsThere)
{
    EXPECT_EQ(_parseMultipleDataPath(LaunchRequest(), &ad), 0);
    ASSERT_NE(ad.upload_item, nullptr);
    EXPECT_THAT(files(), IsEmpty());
    EXPECT_THAT(log.messages(), ElementsAre("array len = 0, ret = " + keyNotFound + " "));

    const std::string path = file("a.jpg");
    ASSERT_EQ(multiple({path}), 0);
    EXPECT_EQ(_parseMultipleDataPath(LaunchRequest(), &ad), 0);
    EXPECT_THAT(files(), ElementsAre(path));
}

TEST_F(ShareRequest, SecondListReplacesTheFilesAndMayKeepAStaleCount)
{
    ASSERT_EQ(multiple({file("a.jpg"), file("b.jpg")}), 0);
    EXPECT_EQ(multiple({file("c.zip")}), 0);
    EXPECT_THAT(files(), IsEmpty());
    EXPECT_EQ(ad.upload_item->files_count, 2);
    EXPECT_EQ(ad.upload_item->files_size, 0);
    EXPECT_EQ(unsupported_file_count, 1);
}

// Text

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
