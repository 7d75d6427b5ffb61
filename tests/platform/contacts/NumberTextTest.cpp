#include <gtest/gtest.h>

#include "NumberText.h"

namespace pelliko::contacts
{

TEST(NumberText, CleaningKeepsDigitsStarHashAndALeadingPlus)
{
    const struct {
        const char *written;
        const char *cleaned;
    } rows[] = {
        {"+44 (20) 7946-0123", "+442079460123"},
        {"0151/123.456", "0151123456"},
        {"*100#", "*100#"},
        {"12+34", "1234"},      // a plus inside is formatting
        {"\u0661\u0662", "12"}, // Arabic-Indic digits
        {"+", ""},
        {"call me", ""},
        {"", ""},
    };
    for (const auto &row : rows)
        EXPECT_EQ(cleanNumber(row.written), row.cleaned) << row.written;
}

TEST(NumberText, NormalizingWritesTheInternationalPrefixAsPlus)
{
    EXPECT_EQ(normalizeNumber("00 49 151 123"), "+49151123");
    EXPECT_EQ(normalizeNumber("0151 123"), "0151123");
    EXPECT_EQ(normalizeNumber("00"), "00");
}

TEST(NumberText, FoldingRemovesCaseInEveryScript)
{
    EXPECT_EQ(foldText("ANNA"), foldText("anna"));
    EXPECT_EQ(foldText("ÖZGÜR"), foldText("özgür"));
    EXPECT_EQ(foldText("Ünal"), foldText("U\u0308nal"));
    EXPECT_NE(foldText("Anna"), foldText("Anne"));
}

TEST(NumberText, FoldingSurvivesBytesThatAreNoText)
{
    EXPECT_EQ(foldText("a\xff"), "a\xef\xbf\xbd");
}

} // namespace pelliko::contacts
