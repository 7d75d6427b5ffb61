#include "SourceFile.h"

#include "Fakes.h"

#include <sys/stat.h>

using namespace pelliko::service;

namespace
{
struct Source : testing::Test {
    Folder folder;
    std::string path = folder.make("photo.jpg", "0123456789");
    FileStamp stamp;
    std::string failure;
    Source() { stampOf(path, stamp); }
};
} // namespace

TEST_F(Source, readsAnyPart)
{
    const auto file = SourceFile::open(path, stamp, failure);
    ASSERT_TRUE(file);
    char buffer[4] = {};
    EXPECT_EQ(file->read(buffer, 3, 7), 3);
    EXPECT_STREQ(buffer, "789");
    EXPECT_EQ(file->read(buffer, 3, 10), 0);
    EXPECT_TRUE(file->unchanged());
}

TEST_F(Source, aFileThatWasRewrittenIsNotOpened)
{
    std::ofstream(path) << "other";
    EXPECT_FALSE(SourceFile::open(path, stamp, failure));
    EXPECT_EQ(failure, "file_changed");
}

TEST_F(Source, aFileThatIsCutWhileItIsOpenIsNoticed)
{
    const auto file = SourceFile::open(path, stamp, failure);
    ASSERT_TRUE(file);
    std::filesystem::resize_file(path, 4);
    EXPECT_FALSE(file->unchanged());
    char buffer[8];
    EXPECT_EQ(file->read(buffer, 8, 6), 0);
}

TEST_F(Source, aMissingFileHasVanished)
{
    std::filesystem::remove(path);
    EXPECT_FALSE(SourceFile::open(path, stamp, failure));
    EXPECT_EQ(failure, "file_vanished");
}

TEST_F(Source, foldersAndPipesAreNoFiles)
{
    FileStamp other;
    EXPECT_FALSE(stampOf(testing::TempDir(), other));
    const std::string pipe = folder.file("pipe");
    ASSERT_EQ(mkfifo(pipe.c_str(), 0600), 0);
    EXPECT_FALSE(stampOf(pipe, other));
    EXPECT_FALSE(SourceFile::open(pipe, stamp, failure)) << "and opening one does not hang";
}
