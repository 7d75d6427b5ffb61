#include "PartFile.h"

#include "Fakes.h"

using namespace pelliko::service;

namespace
{
std::string contentOf(const std::string &path)
{
    std::ifstream file(path);
    return {std::istreambuf_iterator<char>(file), {}};
}
} // namespace

TEST(PartFile, goesOnWhereAnEarlierOneEnded)
{
    const Folder folder;
    const std::string path = folder.make("part", "one ");
    EXPECT_EQ(sizeOfPart(path), 4);
    PartFile part(path, 4, 7);
    EXPECT_TRUE(part.begin(206));
    EXPECT_TRUE(part.take("t"));
    EXPECT_TRUE(part.take("wo"));
    EXPECT_TRUE(part.end());
    EXPECT_EQ(contentOf(path), "one two");
}

TEST(PartFile, beginsAgainWhenTheWholeFileComes)
{
    const Folder folder;
    const std::string path = folder.make("part", "rubbish that is longer");
    PartFile part(path, 4, 3);
    EXPECT_TRUE(part.begin(200) && part.take("two") && part.end());
    EXPECT_EQ(contentOf(path), "two");
}

TEST(PartFile, isOnlyWholeWithAsManyBytesAsWereAnnounced)
{
    const Folder folder;
    PartFile shorter(folder.file("short"), 0, 4);
    EXPECT_TRUE(shorter.begin(200) && shorter.take("two"));
    EXPECT_FALSE(shorter.end());
    PartFile longer(folder.file("long"), 0, 2);
    EXPECT_TRUE(longer.begin(200));
    EXPECT_FALSE(longer.take("two"));
    EXPECT_EQ(longer.fault(), "too_much");
}

TEST(PartFile, aFullDiskAndAFolderThatIsNoneAreToldApart)
{
    PartFile full("/dev/full", 0, 3);
    EXPECT_TRUE(full.begin(200));
    EXPECT_FALSE(full.take("two"));
    EXPECT_EQ(full.fault(), "disk_full");
    PartFile nowhere("/dev/null/part", 0, 3);
    EXPECT_FALSE(nowhere.begin(200));
    EXPECT_EQ(nowhere.fault(), "disk_failed");
}

TEST(PartFile, writesNothingAfterItWasAbandonedAndFollowsNoLink)
{
    const Folder folder;
    PartFile late(folder.file("late"), 0, 3);
    late.abandon();
    EXPECT_FALSE(late.begin(200));
    EXPECT_FALSE(std::filesystem::exists(folder.file("late")));
    const std::string target = folder.make("target", "mine");
    std::filesystem::create_symlink(target, folder.file("link"));
    EXPECT_EQ(sizeOfPart(folder.file("link")), 0);
    PartFile link(folder.file("link"), 0, 3);
    EXPECT_FALSE(link.begin(200));
    EXPECT_EQ(contentOf(target), "mine");
}
