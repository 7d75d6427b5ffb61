#include "shares/FileNames.h"

#include "text/Escape.h"

#include <gmock/gmock.h>

namespace pelliko::server
{
namespace
{

using testing::ElementsAre;

TEST(FileNames, OnlyTheLastComponentStays)
{
    EXPECT_EQ(cleanFileName("photo.jpg"), "photo.jpg");
    EXPECT_EQ(cleanFileName("../../etc/passwd"), "passwd");
    EXPECT_EQ(cleanFileName("C:\\Users\\Anna\\photo.jpg"), "photo.jpg");
    EXPECT_EQ(cleanFileName("/a/b\\c/d"), "d");
}

TEST(FileNames, NothingLeftIsCalledFile)
{
    for (const char *name :
         {"", ".", "..", "/", "a/", "a/..", "   ", "\n\t", "a\\", " ..", ".. ", "a/ . "})
        EXPECT_EQ(cleanFileName(name), "file") << name;
}

TEST(FileNames, ControlAndDirectionCharactersAreRemoved)
{
    EXPECT_EQ(cleanFileName(std::string_view("a\0b\r\nc\x7f.txt", 11)), "abc.txt");
    EXPECT_EQ(cleanFileName("a\xc2\x85"
                            "b"),
              "ab");
    // The mark that shows "annagpj.exe" as "annaexe.jpg".
    EXPECT_EQ(cleanFileName("anna\xe2\x80\xaegpj.exe"), "annagpj.exe");
    // A control character between the dots must not make a way up out of them.
    EXPECT_EQ(cleanFileName(".\x01."), "file");
}

TEST(FileNames, OtherScriptsStay)
{
    EXPECT_EQ(cleanFileName("写真 ü.jpg"), "写真 ü.jpg");
}

TEST(FileNames, LongNamesKeepTheirExtensionAndWholeCharacters)
{
    std::string name;
    for (int i = 0; i < 100; ++i)
        name += "写";
    const std::string clean = cleanFileName(name + ".jpeg");
    EXPECT_LE(clean.size(), 255U);
    EXPECT_GT(clean.size(), 250U);
    EXPECT_EQ(clean.substr(clean.size() - 5), ".jpeg");
    EXPECT_TRUE(isUtf8(clean));
}

TEST(FileNames, ABlankWhereANameIsCutGoesToo)
{
    const std::string clean = cleanFileName(std::string(254, 'x') + " yy");
    EXPECT_EQ(clean, std::string(254, 'x'));
    EXPECT_EQ(cleanFileName(clean), clean);
}

TEST(FileNames, MalformedTypesBecomeUnknownBytes)
{
    EXPECT_EQ(cleanType("image/jpeg"), "image/jpeg");
    EXPECT_EQ(cleanType("application/vnd.a+xml"), "application/vnd.a+xml");
    for (const char *type : {"", "image", "/", "image/", "/jpeg", "a/b/c", "text/html\r\nX: y",
                             "text/html; charset=x"})
        EXPECT_EQ(cleanType(type), "application/octet-stream") << type;
}

TEST(FileNames, EqualNamesAreNumbered)
{
    EXPECT_THAT(uniqueNames({"a.jpg", "a.jpg", "b", "A.JPG", "b"}),
                ElementsAre("a.jpg", "a (2).jpg", "b", "A (3).JPG", "b (2)"));
}

TEST(FileNames, ANumberedNameDoesNotTakeAnothersPlace)
{
    EXPECT_THAT(uniqueNames({"a.jpg", "a.jpg", "a (2).jpg"}),
                ElementsAre("a.jpg", "a (3).jpg", "a (2).jpg"));
}

TEST(FileNames, LongEqualNamesDiffer)
{
    const std::string name(255, 'x');
    const auto names = uniqueNames({name, name});
    EXPECT_NE(names[0], names[1]);
    EXPECT_EQ(names[1].size(), 255U);
}

} // namespace
} // namespace pelliko::server
