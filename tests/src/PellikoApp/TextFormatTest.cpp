#include "PellikoApp/TextFormat.h"

#include <clocale>
#include <cstdio>
#include <cstdlib>
#include <gtest/gtest.h>
#include <string>

namespace pelliko
{
namespace
{

std::string copied(size_t size, const char *text)
{
    std::string buffer(size, 'x');
    copyText(buffer.data(), size, text);
    return buffer.c_str();
}

template <typename... Arguments>
std::string formatted(size_t size, const char *format, const char *kinds, Arguments... arguments)
{
    std::string buffer(size, 'x');
    formatTranslated(buffer.data(), size, format, kinds, arguments...);
    return buffer.c_str();
}

TEST(TextFormat, ACopyThatFitsIsWhole)
{
    EXPECT_EQ(copied(4, "abc"), "abc");
    EXPECT_EQ(copied(4, ""), "");
    EXPECT_EQ(copied(4, nullptr), "");
}

TEST(TextFormat, ACopyIsCutAtItsSize)
{
    EXPECT_EQ(copied(4, "abcd"), "abc");
    EXPECT_EQ(copied(1, "abcd"), "");
}

TEST(TextFormat, NoCharacterIsCutInTheMiddle)
{
    EXPECT_EQ(copied(3, "aä"), "a");
    EXPECT_EQ(copied(4, "aäb"), "aä");
    EXPECT_EQ(copied(4, "a€b"), "a");
    EXPECT_EQ(copied(5, "a€b"), "a€");
    EXPECT_EQ(copied(4, "\xf0\x9f\x98\x80!"), "");
    EXPECT_EQ(copied(5, "\xf0\x9f\x98\x80!"), "\xf0\x9f\x98\x80");
}

TEST(TextFormat, ATranslationIsPrintedWithItsArguments)
{
    EXPECT_EQ(formatted(100, "Sending %d files", "d", 3), "Sending 3 files");
    EXPECT_EQ(formatted(100, "100%% of %d", "d", 3), "100% of 3");
    EXPECT_EQ(formatted(100, "%d: %s%s", "dss", 2, "1.50", "MB"), "2: 1.50MB");
}

TEST(TextFormat, ATranslationMayTurnTheOrderAround)
{
    EXPECT_EQ(formatted(100, "bis %2$s: %1$s", "ss", "http://a/b", "2026/01/02"),
              "bis 2026/01/02: http://a/b");
}

TEST(TextFormat, ATranslationMayLeaveOutTheLastArguments)
{
    EXPECT_EQ(formatted(100, "plain text", "dss", 2, "a", "b"), "plain text");
    EXPECT_EQ(formatted(100, "only %s", "ss", "a", "b"), "only a");
}

TEST(TextFormat, ATranslationThatAsksForSomethingElseIsShownAsItStands)
{
    for (const char *format : {"%s files", "%d %d", "%n", "%*d", "%ld", "%", "%5", "%2$d %1$d",
                               "%2$d", "%1$d %d", "%0$d"})
        EXPECT_EQ(formatted(100, format, "d", 3), format);
    EXPECT_EQ(formatted(100, "%2$s", "ss", "a", "b"), "%2$s");
}

TEST(TextFormat, ALongResultIsCutBetweenCharacters)
{
    EXPECT_EQ(formatted(6, "%sääää", "s", "ab"), "abä");
    EXPECT_EQ(formatted(7, "%sääää", "s", "ab"), "abää");
}

// The world's build has German; without it the test says so instead of passing for nothing.
TEST(TextFormat, NumbersKeepTheirPointInAnyLanguage)
{
    if (!setlocale(LC_ALL, "de_DE.UTF-8"))
        GTEST_SKIP() << "no German locale here";
    char text[32];
    snprintf(text, sizeof(text), "%.2f", 1.5);
    EXPECT_STREQ(text, "1,50");
    {
        const PlainNumbers plain;
        snprintf(text, sizeof(text), "%.2f", 1.5);
        EXPECT_STREQ(text, "1.50");
        EXPECT_EQ(strtod("2.25", nullptr), 2.25);
    }
    snprintf(text, sizeof(text), "%.2f", 1.5);
    EXPECT_STREQ(text, "1,50");
    setlocale(LC_ALL, "C");
}

} // namespace
} // namespace pelliko
