// The files that a launch request names.
#include "ShareRequestScene.h"
#include "support/PanelHistory.h"

#include <gmock/gmock.h>

namespace pelliko
{
namespace
{

using test::LaunchRequest;
using test::ShareRequest;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

constexpr const char *typeNotSupported = "IDS_RSH_TPOP_CANT_SHARE_FILES_FILE_TYPE_NOT_SUPPORTED";
constexpr const char *exiting = "No upload_data request id exist so app is exiting";
constexpr const char *reason = "reject_reason: not_supported_files";
constexpr const char *refused =
    "type: 0, feature: PK07 [Pelliko_Share_reject], extra: not_supported_files, value: (null)";
const std::string keyNotFound = std::to_string(APP_CONTROL_ERROR_KEY_NOT_FOUND);

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

} // namespace
} // namespace pelliko
