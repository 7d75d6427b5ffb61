#include "pages/LandingPage.h"
#include "pages/PageCatalogues.h"

#include <gmock/gmock.h>

namespace pelliko::server
{
namespace
{

using testing::HasSubstr;
using testing::Not;

LinkRecord link(std::vector<FileRecord> files)
{
    LinkRecord record;
    record.senderNumber = "+4915112345678";
    record.share.deadline = 1763733909;
    record.share.files = std::move(files);
    return record;
}

TEST(LandingPage, TellsSenderFilesSizesAndEnd)
{
    const std::string body =
        landingPage(link({{"a.jpg", "", 1000, 1000, "", "k"}, {"b.pdf", "", 500, 500, "", "k"}}),
                    "TOKEN", {})
            .body;
    EXPECT_THAT(body, HasSubstr("2 files from +4915112345678"));
    EXPECT_THAT(body, HasSubstr("1.5 kB in all"));
    EXPECT_THAT(body, HasSubstr("21 November 2025, 14:05 UTC"));
    EXPECT_THAT(body, HasSubstr("href=\"TOKEN/all.zip\""));
    EXPECT_THAT(body, HasSubstr("href=\"TOKEN/1\""));
    EXPECT_THAT(body, Not(HasSubstr("<script")));
}

TEST(LandingPage, OneFileNeedsNoZip)
{
    const std::string body = landingPage(link({{"a.jpg", "", 1, 1, "", "k"}}), "TOKEN", {}).body;
    EXPECT_THAT(body, HasSubstr("1 file from"));
    EXPECT_THAT(body, Not(HasSubstr("all.zip")));
}

TEST(LandingPage, NamesCannotBecomeMarkup)
{
    const std::string body =
        landingPage(link({{"<img src=x onerror=\"a\">.jpg", "", 1, 1, "", "k"}}), "TOKEN", {}).body;
    EXPECT_THAT(body, Not(HasSubstr("<img")));
    EXPECT_THAT(body, HasSubstr("&lt;img src=x onerror=&quot;a&quot;&gt;.jpg"));
}

TEST(LandingPage, EndedAndUnknownLinksSayWhy)
{
    const Response gone = errorPage(Refusal(Error::gone), {});
    EXPECT_EQ(gone.status, 410);
    EXPECT_THAT(gone.body, HasSubstr("No longer available"));
    const Response unknown = errorPage(Refusal(Error::notFound), {});
    EXPECT_EQ(unknown.status, 404);
    EXPECT_THAT(unknown.body, HasSubstr("This link is not known"));
}

TEST(PageLanguage, IsTheBestOfTheReadersWishes)
{
    const auto chosen = [](const char *header) {
        return std::string(PageLanguage::preferred(header).tag());
    };
    EXPECT_EQ(chosen("de-CH, de;q=0.9, en;q=0.8"), "de");
    EXPECT_EQ(chosen("en;q=0.3, fr;q=0.7"), "fr");
    EXPECT_EQ(chosen("sw, xx;q=0.9, nl;q=0.1"), "nl");
    EXPECT_EQ(chosen("pt"), "pt-BR");
    EXPECT_EQ(chosen("PT-pt"), "pt-BR");
    EXPECT_EQ(chosen("iw-IL"), "he");
    EXPECT_EQ(chosen("zh"), "zh-CN");
    EXPECT_EQ(chosen("zh-SG"), "zh-CN");
    EXPECT_EQ(chosen("zh-HK"), "zh-TW");
    EXPECT_EQ(chosen("zh-Hant"), "zh-TW");
    EXPECT_EQ(chosen("zh-Hans-TW"), "zh-CN");
}

TEST(PageLanguage, IsEnglishWhereNothingElseFits)
{
    for (const char *header :
         {"", "*", "en-US,de;q=0.5", "sw", "de;q=0", "de;q=x, ;;,,", "-", "q=1"})
        EXPECT_STREQ(PageLanguage::preferred(header).tag(), "en") << header;
    EXPECT_STREQ(PageLanguage::preferred(std::string(100000, ',') + "de").tag(), "de");
    std::string endless;
    for (int i = 0; i < 1000; ++i)
        endless += "sw,";
    EXPECT_STREQ(PageLanguage::preferred(endless + "de").tag(), "en");
}

TEST(PageLanguage, NumbersTakeTheirForm)
{
    const PageLanguage polish = PageLanguage::preferred("pl");
    const auto bytes = [&](std::uint64_t number) { return polish.size(number); };
    EXPECT_EQ(bytes(1), "1 bajt");
    EXPECT_EQ(bytes(2), "2 bajty");
    EXPECT_EQ(bytes(5), "5 bajtów");
    EXPECT_EQ(bytes(12), "12 bajtów");
    EXPECT_EQ(bytes(22), "22 bajty");
    EXPECT_EQ(bytes(1500), "1,5\u00a0kB");
    EXPECT_EQ(PageLanguage().size(1500), "1.5 kB");
    EXPECT_EQ(PageLanguage::preferred("fr").size(1500000), "1,5\u00a0Mo");
}

TEST(PageLanguage, EveryLanguageFillsEveryPlace)
{
    for (const PageCatalogue &catalogue : pageCatalogues()) {
        const PageLanguage language = PageLanguage::preferred(catalogue.tag);
        ASSERT_STREQ(language.tag(), catalogue.tag);
        for (const std::uint64_t count : {0U, 1U, 2U, 3U, 5U, 11U, 21U, 22U, 100U, 111U}) {
            LinkRecord record = link(std::vector<FileRecord>(count, {"a", "", 7, 7, "", "k"}));
            const std::string body = landingPage(record, "TOKEN", language).body;
            const std::string text = body.substr(body.find("<body>"));
            EXPECT_THAT(text, Not(HasSubstr("%"))) << catalogue.tag << count;
            EXPECT_THAT(text, HasSubstr("+4915112345678")) << catalogue.tag << count;
            EXPECT_THAT(text, HasSubstr("2025")) << catalogue.tag;
        }
    }
}

TEST(PageLanguage, NoPageMixesInEnglish)
{
    const std::vector<FileRecord> files(2, {"a", "", 7, 7, "", "k"});
    for (const PageCatalogue &catalogue : pageCatalogues()) {
        const PageLanguage language = PageLanguage::preferred(catalogue.tag);
        const std::string page = landingPage(link(files), "TOKEN", language).body;
        for (const char *words : {"files from", "in all", "Available", "Download all"})
            EXPECT_THAT(page, Not(HasSubstr(words))) << catalogue.tag;
        for (const std::string &own : {errorPage(Refusal(Error::gone), language).body,
                                       errorPage(Refusal(Error::notFound), language).body}) {
            for (const char *words : {"available", "the sender", "link is not", "Nothing here"})
                EXPECT_THAT(own, Not(HasSubstr(words))) << catalogue.tag;
        }
        EXPECT_THAT(errorPage(Refusal(Error::noSpace), language).body,
                    Not(HasSubstr("could not answer")))
            << catalogue.tag;
    }
}

TEST(LandingPage, SpeaksTheReadersLanguage)
{
    const PageLanguage german = PageLanguage::preferred("de");
    const Response page = landingPage(
        link({{"a.jpg", "", 1000, 1000, "", "k"}, {"b", "", 500, 500, "", "k"}}), "TOKEN", german);
    EXPECT_THAT(page.body, HasSubstr("<html lang=\"de\" dir=\"ltr\">"));
    EXPECT_THAT(page.body, HasSubstr("2 Dateien von +4915112345678"));
    EXPECT_THAT(page.body, HasSubstr(">21.11.2025 14:05 UTC</time>"));
    EXPECT_THAT(page.body, HasSubstr("Alles herunterladen (1,5\u00a0kB)"));
    const Response refused = errorPage(Refusal(Error::noSpace), german);
    EXPECT_THAT(refused.body, HasSubstr("Das hat nicht geklappt"));
    EXPECT_THAT(refused.body, HasSubstr("<p class=\"soft\" lang=\"en\" dir=\"ltr\">"));
}

TEST(LandingPage, RunsFromTheRightInArabicAndHebrew)
{
    for (const char *tag : {"ar", "he"}) {
        const std::string body = landingPage(link({{"a.jpg", "", 1500, 1500, "", "k"}}), "TOKEN",
                                             PageLanguage::preferred(tag))
                                     .body;
        EXPECT_THAT(body, HasSubstr(std::string("<html lang=\"") + tag + "\" dir=\"rtl\">"));
        // A plus sign at the wrong end would make another number of it.
        EXPECT_THAT(body, HasSubstr("\u2066+4915112345678\u2069"));
        EXPECT_THAT(body, HasSubstr("dir=\"auto\">a.jpg"));
    }
}

} // namespace
} // namespace pelliko::server
