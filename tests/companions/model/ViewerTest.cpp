// What the viewer says of a received share and takes for one.
#include <viewer/Desktop.h>
#include <viewer/Opening.h>
#include <viewer/Words.h>

#include <Formats.h>

#include <gtest/gtest.h>

#include <clocale>
#include <set>

namespace
{

using pelliko::companion::sizeText;
using namespace pelliko::viewer;

TEST(ViewerToken, OnlyWhatCanBeATokenIsAskedFor)
{
    for (const std::string good : {"a", "AbC_-123456789012345678", "012345678901234567890123"})
        EXPECT_TRUE(isToken(good)) << good;
    for (const std::string &bad :
         {std::string(), std::string(25, 'a'), std::string(1000, 'a'), std::string("../x"),
          std::string("a b"), std::string("ä"), std::string("a\0b", 3)})
        EXPECT_FALSE(isToken(bad)) << bad;
}

TEST(ViewerWords, EveryFaultHasItsOwnSentence)
{
    std::set<std::string> sentences;
    for (int code :
         {PELLIKO_SHARES_ERROR_NOT_FOUND, PELLIKO_SHARES_ERROR_EXPIRED,
          PELLIKO_SHARES_ERROR_WITHDRAWN, PELLIKO_SHARES_ERROR_UNREACHABLE,
          PELLIKO_SHARES_ERROR_REFUSED, PELLIKO_SHARES_ERROR_NO_SPACE, PELLIKO_SHARES_ERROR_IO,
          PELLIKO_SHARES_ERROR_BUSY, PELLIKO_ERROR_SERVICE_NOT_RUNNING})
        sentences.insert(faultText(code));
    EXPECT_EQ(9U, sentences.size());
    EXPECT_EQ("", faultText(0));
}

TEST(ViewerWords, AnUnknownSenderIsSomebody)
{
    EXPECT_EQ("Somebody shared with you", titleText({}));
}

TEST(ViewerWords, ARowFollowsItsFile)
{
    const pelliko::companion::ShareFile film{"film.mp4", 200, "video/mp4"};
    FileState state;
    EXPECT_EQ("Press to save", rowOf(film, state).third);
    state.kind = FileState::Kind::saving;
    state.done = 50;
    EXPECT_EQ("Being saved, \u206825 %\u2069", rowOf(film, state).third);
    state.kind = FileState::Kind::saved;
    EXPECT_EQ("Saved. Press to open", rowOf(film, state).third);
    // An empty file has no per cent to divide by.
    EXPECT_EQ("Being saved, \u20680 %\u2069",
              rowOf({"empty", 0, ""}, {FileState::Kind::saving, 0, ""}).third);
}

TEST(ViewerDesktop, TheNameTellsTheKindWhenTheTypeDoesNot)
{
    EXPECT_EQ("image-x-generic", iconName("image/jpeg", "x"));
    EXPECT_EQ("video-x-generic", iconName("", "film.mp4"));
    EXPECT_EQ("audio-x-generic", iconName("application/octet-stream", "voice.ogg"));
}

TEST(Formats, SizesAreRoundedBeforeTheirUnitIsChosen)
{
    EXPECT_EQ("0 B", sizeText(-5));
    EXPECT_EQ("999 B", sizeText(999));
    EXPECT_EQ("1.0 kB", sizeText(1000));
    EXPECT_EQ("999.9 kB", sizeText(999'900));
    EXPECT_EQ("1.0 MB", sizeText(999'999));
    EXPECT_EQ("1.0 GB", sizeText(1'000'000'000));
}

TEST(Formats, APlainLocaleTakesTheCataloguesForm)
{
    setenv("TZ", "UTC", 1);
    setlocale(LC_ALL, "C");
    EXPECT_EQ("2100-01-01 00:00", pelliko::companion::dateText(4'102'444'800, "%Y-%m-%d %H:%M"));
}

} // namespace
