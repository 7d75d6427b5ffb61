#include "SaveName.h"

#include "Fakes.h"

using namespace pelliko::service;

TEST(SaveName, isOneComponentOfAPath)
{
    EXPECT_EQ(plainFileName("photo.jpg"), "photo.jpg");
    EXPECT_EQ(plainFileName("../../etc/passwd"), "passwd");
    EXPECT_EQ(plainFileName("C:\\Windows\\evil.exe"), "evil.exe");
    EXPECT_EQ(plainFileName("a\nb\x1b[1m.txt"), "ab[1m.txt");
    for (const char *name : {"", ".", "..", "/", "folder/", "\n"}) {
        EXPECT_EQ(plainFileName(name), "file") << name;
    }
    EXPECT_EQ(plainFileName("Grüße.txt"), "Grüße.txt");
    EXPECT_EQ(plainFileName("\xff.txt"), "\xEF\xBF\xBD.txt");
}

TEST(SaveName, keepsItsExtensionWhenItIsCut)
{
    std::string stem;
    for (int i = 0; i < 200; ++i) {
        stem += "ü";
    }
    const std::string name = plainFileName(stem + ".jpeg");
    EXPECT_LE(name.size(), 255U);
    EXPECT_GE(name.size(), 253U);
    EXPECT_EQ(name.substr(name.size() - 7), "ü.jpeg") << "cut between characters";
    EXPECT_LE(numberedName(name, 12).size(), 255U);
    EXPECT_TRUE(numberedName(name, 12).ends_with(" (12).jpeg"));
}

TEST(SaveName, theNumberStandsBeforeTheExtension)
{
    EXPECT_EQ(numberedName("photo.jpg", 2), "photo (2).jpg");
    EXPECT_EQ(numberedName("README", 3), "README (3)");
    EXPECT_EQ(numberedName(".profile", 2), ".profile (2)");
}

TEST(SaveName, nothingThatIsThereIsReplaced)
{
    const Folder folder;
    folder.make("a.txt", "mine");
    std::filesystem::create_directory(folder.file("a (2).txt"));
    const std::string part = folder.make("part", "new");
    const std::string base = folder.file("");
    const std::string path = renameToFree(part, base.substr(0, base.size() - 1), "a.txt");
    EXPECT_EQ(path, folder.file("a (3).txt"));
    EXPECT_EQ(std::filesystem::file_size(folder.file("a.txt")), 4U);
    EXPECT_FALSE(std::filesystem::exists(part));
}
