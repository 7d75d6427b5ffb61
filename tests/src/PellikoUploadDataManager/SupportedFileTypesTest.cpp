#include "PellikoUploadDataManager/SupportedFileTypes.h"
#include "support/FileLog.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace pelliko
{
namespace
{

using ::testing::ElementsAre;
using ::testing::IsEmpty;

std::string matchOf(const char *path)
{
    const char *row = supportedExtensionAt(supportedExtensionPosition(path));
    return row ? row : "none";
}

TEST(SupportedFileTypes, CaseIsIgnored)
{
    EXPECT_EQ(isSupportedFileType("/opt/usr/media/Images/photo.JPG"), 1);
    EXPECT_EQ(supportedExtensionPosition("/opt/usr/media/Images/photo.JPG"), 58);
    EXPECT_EQ(matchOf("a.Jpeg"), "jpeg");
    EXPECT_EQ(matchOf("a.PDF"), "pdf");
}

TEST(SupportedFileTypes, MatchIsLoggedWithTheExtensionAsGiven)
{
    const test::FileLog log;
    isSupportedFileType("/p/photo.JPG");
    EXPECT_THAT(log.messages(), ElementsAre("extension[JPG], match[jpg]"));
}

TEST(SupportedFileTypes, UnknownOrMissingExtensionIsNotSupported)
{
    const test::FileLog log;
    EXPECT_EQ(isSupportedFileType("/tmp/archive.zip"), 0);
    EXPECT_EQ(isSupportedFileType("/tmp/noextension"), 0);
    EXPECT_EQ(isSupportedFileType("/tmp/x.tar.gz"), 0);
    EXPECT_EQ(isSupportedFileType(nullptr), 0);
    EXPECT_EQ(isSupportedFileType("/tmp/movie.mpeg4"), 0);
    EXPECT_THAT(log.messages(), IsEmpty());
}

TEST(SupportedFileTypes, DotOfAFolderCountsWhenTheNameHasNone)
{
    EXPECT_EQ(isSupportedFileType("/a/b.c/file"), 0);
    EXPECT_EQ(matchOf("/a.b/c.mp3"), "mp3");
}

TEST(SupportedFileTypes, BeginningOfARowMatchesTheFirstSuchRow)
{
    EXPECT_EQ(supportedExtensionPosition("/tmp/movie.mp"), 0);
    EXPECT_EQ(matchOf("a.3g"), "3gp");
    EXPECT_EQ(matchOf("a.x"), "xmf");
    EXPECT_EQ(matchOf("a.h"), "hwp");
    EXPECT_EQ(matchOf("a.i"), "imy");
}

TEST(SupportedFileTypes, EmptyExtensionMatchesTheFirstRow)
{
    EXPECT_EQ(matchOf("/tmp/file."), "mpeg");
}

TEST(SupportedFileTypes, LongerExtensionIsNotTakenForAShorterRow)
{
    EXPECT_EQ(supportedExtensionPosition("/tmp/song.flac"), 56);
    EXPECT_EQ(supportedExtensionPosition("/tmp/song.fl"), 55);
}

TEST(SupportedFileTypes, EarlierLongerRowOfTheSameKindWins)
{
    EXPECT_EQ(supportedExtensionPosition("a.htm"), 75);
    EXPECT_EQ(supportedExtensionPosition("a.m2t"), 21);
    EXPECT_EQ(matchOf("a.ht"), "html");
    EXPECT_EQ(matchOf("a.f"), "flv");
}

TEST(SupportedFileTypes, RowOfItsOwnWinsOverAnEarlierLongerRowOfAnotherKind)
{
    EXPECT_EQ(supportedExtensionPosition("a.fl"), 55);
    EXPECT_EQ(supportedExtensionPosition("a.FL"), 55);
    EXPECT_EQ(supportedExtensionPosition("a.flv"), 18);
}

TEST(SupportedFileTypes, EveryOtherRowIsFoundUnderItsOwnName)
{
    for (int row = 0; row < 80; ++row) {
        const std::string name = supportedExtensionAt(row);
        if (name == "htm" || name == "m2t")
            continue;
        EXPECT_EQ(supportedExtensionPosition(("a." + name).c_str()), row) << name;
    }
}

TEST(SupportedFileTypes, SentinelIsNeverMatched)
{
    EXPECT_EQ(isSupportedFileType("/tmp/notes.invalid"), 0);
    EXPECT_EQ(isSupportedFileType("/tmp/notes.inv"), 0);
    EXPECT_EQ(supportedExtensionAt(80), nullptr);
    EXPECT_EQ(supportedExtensionAt(-1), nullptr);
}

TEST(SupportedFileTypes, NameThatIsOnlyAnExtensionIsSupported)
{
    EXPECT_EQ(isSupportedFileType("/x/.jpg"), 1);
}

TEST(SupportedFileTypes, PositionsStandForKindsOfContent)
{
    EXPECT_EQ(supportedExtensionPosition("a.smi"), 24);
    EXPECT_EQ(supportedExtensionPosition("a.mp3"), 25);
    EXPECT_EQ(supportedExtensionPosition("a.jpeg"), 57);
    EXPECT_EQ(supportedExtensionPosition("a.ppt"), 65);
    EXPECT_EQ(supportedExtensionPosition("a.txt"), 74);
    EXPECT_EQ(supportedExtensionPosition("a.vcf"), 77);
    EXPECT_EQ(supportedExtensionPosition("a.vts"), 79);
}

} // namespace
} // namespace pelliko
