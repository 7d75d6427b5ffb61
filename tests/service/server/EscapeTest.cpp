#include "text/Escape.h"
#include "text/Base64.h"
#include "text/Secrets.h"

#include <gtest/gtest.h>

#include <set>

namespace pelliko::server
{
namespace
{

TEST(Escape, HtmlLosesItsMeaning)
{
    EXPECT_EQ(htmlEscape("<b onclick='x' class=\"y\">&amp;"),
              "&lt;b onclick=&#39;x&#39; class=&quot;y&quot;&gt;&amp;amp;");
}

TEST(Escape, DispositionOfAPlainName)
{
    EXPECT_EQ(attachmentDisposition("photo 1.jpg"),
              "attachment; filename=\"photo 1.jpg\"; filename*=UTF-8''photo%201.jpg");
}

TEST(Escape, DispositionCannotBeLeftByQuotesOrLineBreaks)
{
    EXPECT_EQ(attachmentDisposition("a\"b\\c\r\nX: y%41"),
              "attachment; filename=\"a_b_c__X: y_41\"; "
              "filename*=UTF-8''a%22b%5Cc%0D%0AX%3A%20y%2541");
}

TEST(Escape, DispositionOfOtherScriptsHasOneUnderscoreForEachCharacter)
{
    EXPECT_EQ(attachmentDisposition("写真.jpg"),
              "attachment; filename=\"__.jpg\"; filename*=UTF-8''%E5%86%99%E7%9C%9F.jpg");
}

TEST(Escape, Utf8IsToldFromOtherBytes)
{
    for (const char *good : {"", "abc", "ü", "写", "\xf0\x9f\x98\x80", "\xf4\x8f\xbf\xbf"})
        EXPECT_TRUE(isUtf8(good)) << good;
    // Latin-1, a cut sequence, overlong forms, a surrogate, beyond the last code point.
    for (const char *bad : {"\xfc", "\xe5\x86", "\xc0\xaf", "\xe0\x80\xaf", "\xed\xa0\x80",
                            "\xf4\x90\x80\x80", "\x80"})
        EXPECT_FALSE(isUtf8(bad)) << bad;
}

TEST(Escape, DatesInEveryForm)
{
    constexpr std::int64_t time = 1763733909;
    EXPECT_EQ(httpDate(time), "Fri, 21 Nov 2025 14:05:09 GMT");
    EXPECT_EQ(readableDate(time), "21 November 2025, 14:05 UTC");
    EXPECT_EQ(isoDate(time), "2025-11-21T14:05:09Z");
}

TEST(Escape, SizesAsPeopleReadThem)
{
    EXPECT_EQ(readableSize(0), "0 bytes");
    EXPECT_EQ(readableSize(1), "1 byte");
    EXPECT_EQ(readableSize(999), "999 bytes");
    EXPECT_EQ(readableSize(1000), "1.0 kB");
    EXPECT_EQ(readableSize(1540), "1.5 kB");
    EXPECT_EQ(readableSize(9960), "10 kB");
    EXPECT_EQ(readableSize(999499), "999 kB");
    EXPECT_EQ(readableSize(999500), "1.0 MB");
    EXPECT_EQ(readableSize(1073741824), "1.1 GB");
}

TEST(Base64, KnownVectorsBothWays)
{
    const std::pair<const char *, const char *> vectors[] = {
        {"", ""}, {"f", "Zg=="}, {"fo", "Zm8="}, {"foo", "Zm9v"}, {"foob", "Zm9vYg=="}};
    for (const auto &[plain, coded] : vectors) {
        EXPECT_EQ(base64(plain), coded);
        EXPECT_EQ(base64Decode(coded), plain);
    }
    EXPECT_EQ(base64Url("\xff\xfe\xfd"), "__79");
    for (const char *bad : {"Zg", "Z", "Zg=a", "Zm9v!===", "===="})
        EXPECT_FALSE(base64Decode(bad)) << bad;
}

TEST(Secrets, TokensHave22CharactersAndDiffer)
{
    std::set<std::string> tokens;
    for (int i = 0; i < 1000; ++i) {
        const std::string token = randomToken();
        EXPECT_TRUE(looksLikeToken(token)) << token;
        tokens.insert(token);
    }
    EXPECT_EQ(tokens.size(), 1000U);
}

TEST(Secrets, HashIsTheKnownOne)
{
    const std::string hash = sha256("abc");
    ASSERT_EQ(hash.size(), 32U);
    EXPECT_EQ(base64(hash), "ungWv48Bz+pBQUDeXa4iI7ADYaOWF3qctBD/YfIAFa0=");
}

TEST(Secrets, OtherTextsAreNoTokens)
{
    for (const char *text : {"", "..", "abc", "../../../../etc/passwd", "aaaaaaaaaaaaaaaaaaaaa/",
                             "aaaaaaaaaaaaaaaaaaaaaaa", "aaaaaaaaaaaaaaaaaaaa%2"})
        EXPECT_FALSE(looksLikeToken(text)) << text;
}

} // namespace
} // namespace pelliko::server
