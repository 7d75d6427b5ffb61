#include "pages/LandingPage.h"
#include "pages/ErrorPage.h"
#include "pages/FileKind.h"
#include "pages/HomePage.h"
#include "pages/PageCatalogues.h"
#include "pages/TextInPlace.h"
#include "text/Escape.h"

#include <gmock/gmock.h>

namespace pelliko::server
{
namespace
{

using testing::HasSubstr;
using testing::Not;

constexpr Seconds deadline = 1763733909;
constexpr Seconds now = deadline - 47 * 3600 - 1800;

LinkRecord link(std::vector<FileRecord> files)
{
    LinkRecord record;
    record.senderNumber = "+4915112345678";
    record.share.state = ShareState::finished;
    record.share.deadline = deadline;
    record.share.files = std::move(files);
    return record;
}

std::string pageOf(std::vector<FileRecord> files, const PageLanguage &language = {})
{
    return landingPage(link(std::move(files)), "TOKEN", language, now).body;
}

/// Without the head and its style sheet.
std::string shownIn(const std::string &page)
{
    return page.substr(page.find("<body>"));
}

std::string errorBody(Error error, const PageLanguage &language = {})
{
    return errorPage(Refusal(error), language).body;
}

/// Every refusal that a page can tell of; the others belong to the calls of accounts.
constexpr Error errorsOfPages[] = {
    Error::badRequest, Error::notFound, Error::methodNotAllowed, Error::expired,
    Error::withdrawn,  Error::fileLost, Error::filesLost,        Error::rangeNotSatisfiable,
    Error::internal,   Error::busy,     Error::tooManyAttempts,  Error::noSpace,
    Error::unavailable};

TEST(LandingPage, TellsSenderFilesSizesAndEnd)
{
    const std::string body =
        pageOf({{"a.jpg", "", 1000, 1000, "", "k"}, {"b.pdf", "", 500, 500, "", "k"}});
    EXPECT_THAT(body, HasSubstr("<h1>2 files from +4915112345678</h1>"));
    EXPECT_THAT(body, HasSubstr("1.5 kB in all"));
    EXPECT_THAT(body,
                HasSubstr("<time datetime=\"2025-11-21T14:05:09Z\">21 November 2025, 14:05 UTC"));
    EXPECT_THAT(body, HasSubstr("47 hours left"));
    EXPECT_THAT(body, HasSubstr("href=\"TOKEN/all.zip\""));
    EXPECT_THAT(body, HasSubstr("href=\"TOKEN/1\""));
    EXPECT_THAT(body, HasSubstr("<span class=\"kind\">Picture</span>"));
    EXPECT_THAT(body, HasSubstr("<span class=\"kind\">Document</span>"));
    EXPECT_THAT(body, Not(HasSubstr("<script")));
}

TEST(LandingPage, OneFileNeedsNoZip)
{
    const std::string body = pageOf({{"a.jpg", "", 1, 1, "", "k"}});
    EXPECT_THAT(body, HasSubstr("1 file from"));
    EXPECT_THAT(body, Not(HasSubstr("all.zip")));
}

TEST(LandingPage, TheLastHoursAreTold)
{
    const auto left = [](Seconds seconds) {
        return landingPage(link({{"a", "", 1, 1, "", "k"}}), "TOKEN", {}, deadline - seconds).body;
    };
    EXPECT_THAT(left(7200), HasSubstr("2 hours left"));
    EXPECT_THAT(left(7199), HasSubstr("1 hour left"));
    EXPECT_THAT(left(3599), HasSubstr("Less than an hour left"));
    EXPECT_THAT(left(-5), HasSubstr("Less than an hour left"));
}

TEST(LandingPage, NamesCannotBecomeMarkup)
{
    const std::string body = pageOf({{"<img src=x onerror=\"a\">.jpg", "", 1, 1, "", "k"}});
    EXPECT_THAT(body, Not(HasSubstr("<img")));
    EXPECT_THAT(body, HasSubstr("&lt;img src=x onerror=&quot;a&quot;&gt;.jpg"));
}

TEST(LandingPage, ALostFileIsStruckOffAndLeadsNowhere)
{
    const std::string body = pageOf({{"a.jpg", "", 1000, 1000, "", "k"},
                                     {"<b>.pdf", "", 500, 0, "", ""},
                                     {"c", "", 501, 501, "", "k"}});
    EXPECT_THAT(body,
                HasSubstr("<h1>2 files from +4915112345678</h1>\n<p>1 more file is lost</p>"));
    EXPECT_THAT(body, HasSubstr("1.5 kB in all"));
    EXPECT_THAT(body, HasSubstr("<s><bdi>&lt;b&gt;.pdf</bdi></s>"));
    EXPECT_THAT(body, HasSubstr("Lost: ask the sender to share it again."));
    EXPECT_THAT(body, Not(HasSubstr("500 bytes")));
    EXPECT_THAT(body, HasSubstr("href=\"TOKEN/all.zip\""));
    EXPECT_THAT(body, Not(HasSubstr("href=\"TOKEN/1\"")));
    EXPECT_THAT(body, HasSubstr("href=\"TOKEN/2\""));
}

TEST(LandingPage, TheOneFileThatIsLeftNeedsNoZip)
{
    const std::string body = pageOf({{"a.jpg", "", 7, 0, "", ""}, {"b.jpg", "", 5, 5, "", "k"}});
    EXPECT_THAT(body, HasSubstr("<h1>1 file from"));
    EXPECT_THAT(body, Not(HasSubstr("in all")));
    EXPECT_THAT(body, HasSubstr("class=\"button\" href=\"TOKEN/1\""));
    EXPECT_THAT(body, Not(HasSubstr("all.zip")));
}

TEST(LandingPage, NothingIsSaidOfLossWhereNothingIsLost)
{
    const std::string body = pageOf({{"a.jpg", "", 7, 7, "", "k"}, {"b.jpg", "", 0, 0, "", "k"}});
    EXPECT_THAT(shownIn(body), Not(HasSubstr("lost")));
}

TEST(LandingPage, ATextIsReadInThePage)
{
    const LinkRecord record = link({{"memo.txt", "", 20, 20, "", "k"}});
    const std::string body = landingPage(record, "TOKEN", {}, now, "<b>Hello</b>\nشكرا").body;
    EXPECT_THAT(body, HasSubstr("<h1>Text from +4915112345678</h1>"));
    EXPECT_THAT(body,
                HasSubstr("<div class=\"text\" dir=\"auto\">&lt;b&gt;Hello&lt;/b&gt;\nشكرا</div>"));
    EXPECT_THAT(body, HasSubstr("href=\"TOKEN/0\""));
}

TEST(LandingPage, WhatMessengersShowBesideALinkSaysNothingOfTheShare)
{
    const LinkRecord record = link({{"divorce.pdf", "", 20, 20, "", "k"}});
    const std::string body = landingPage(record, "TOKEN", {}, now).body;
    const std::string head = body.substr(0, body.find("</head>"));
    EXPECT_THAT(head, HasSubstr("<title>Shared with you</title>"));
    EXPECT_THAT(head, HasSubstr("property=\"og:title\" content=\"Shared with you\""));
    EXPECT_THAT(head, HasSubstr("property=\"og:description\" content=\"Somebody shared"));
    EXPECT_THAT(head, HasSubstr("name=\"robots\" content=\"noindex"));
    for (const char *secret : {"divorce", "4915112345678", "TOKEN"})
        EXPECT_THAT(head, Not(HasSubstr(secret)));
}

TEST(TextInPlace, IsOneTextOfALengthForAPage)
{
    const auto shown = [](std::vector<FileRecord> files) {
        return textInPlace(link(std::move(files)).share) != nullptr;
    };
    EXPECT_TRUE(shown({{"memo.txt", "", 65536, 65536, "", "k"}}));
    EXPECT_TRUE(shown({{"memo", "text/plain", 1, 1, "", "k"}}));
    EXPECT_FALSE(shown({{"memo.txt", "", 65537, 65537, "", "k"}}));
    EXPECT_FALSE(shown({{"memo.txt", "", 0, 0, "", "k"}}));
    EXPECT_FALSE(shown({{"page.html", "text/plain", 5, 5, "", "k"}}));
    EXPECT_FALSE(shown({{"a.txt", "", 1, 1, "", "k"}, {"b.txt", "", 1, 1, "", "k"}}));
    EXPECT_FALSE(shown({}));
}

TEST(TextInPlace, KeepsWhatAPageMayShow)
{
    EXPECT_EQ(readableText("\xef\xbb\xbf"
                           "a\r\nb\tc"),
              "a\nb\tc");
    EXPECT_EQ(readableText(std::string("a\0\x1b[31mb\x7f", 9)), "a[31mb");
    EXPECT_EQ(readableText("\xff\xfe"
                           "a"),
              std::nullopt);
}

TEST(FileKind, GoesByWhatTheNameEndsWith)
{
    EXPECT_EQ(kindOf("a.JPEG", "application/pdf"), FileKind::picture);
    EXPECT_EQ(kindOf("a.3gp", ""), FileKind::video);
    EXPECT_EQ(kindOf("a.b.mp3", ""), FileKind::sound);
    EXPECT_EQ(kindOf("Ann Example.vcf", ""), FileKind::contact);
    EXPECT_EQ(kindOf("a.tar.gz", ""), FileKind::archive);
    EXPECT_EQ(kindOf("a.hwp", ""), FileKind::document);
    // Whatever the sender calls it: it is opened as what its name says.
    EXPECT_EQ(kindOf("holiday.jpg.exe", "image/jpeg"), FileKind::other);
    EXPECT_EQ(kindOf("holiday", "Image/JPEG"), FileKind::picture);
    EXPECT_EQ(kindOf("Dr. Example", "text/vcard"), FileKind::contact);
    EXPECT_EQ(kindOf("", ""), FileKind::other);
    EXPECT_EQ(kindOf("a.", "audio/ogg"), FileKind::sound);
}

TEST(ErrorPage, ExpiredWithdrawnAndUnknownLinksSayWhatHappened)
{
    EXPECT_EQ(errorPage(Refusal(Error::expired), {}).status, 410);
    EXPECT_EQ(errorPage(Refusal(Error::withdrawn), {}).status, 410);
    EXPECT_EQ(errorPage(Refusal(Error::notFound), {}).status, 404);
    EXPECT_THAT(errorBody(Error::expired), HasSubstr("<h1>The time is over</h1>"));
    EXPECT_THAT(errorBody(Error::withdrawn), HasSubstr("The sender has taken this share back"));
    EXPECT_THAT(errorBody(Error::notFound), HasSubstr("This link is not known"));
    EXPECT_EQ(errorPage(Refusal(Error::filesLost), {}).status, 410);
    EXPECT_THAT(errorBody(Error::filesLost), HasSubstr("<h1>These files are lost</h1>"));
}

TEST(ErrorPage, WhoHasToWaitIsToldSoAndHowLong)
{
    const Response limited =
        errorPage(Refusal(Error::tooManyAttempts, {}, {{"Retry-After", "90"}}), {});
    EXPECT_EQ(limited.status, 429);
    EXPECT_EQ(limited.headers.back().value, "90");
    EXPECT_THAT(limited.body, HasSubstr("<h1>Too many requests</h1>"));
    EXPECT_THAT(errorBody(Error::busy), HasSubstr("<h1>The server is busy</h1>"));
}

TEST(ErrorPage, FailuresOfTheServerAreNotBlamedOnTheReader)
{
    for (const Error error : {Error::internal, Error::noSpace, Error::unavailable}) {
        EXPECT_THAT(errorBody(error), HasSubstr("The server could not answer"));
        EXPECT_THAT(errorBody(error), HasSubstr(htmlEscape(errorEntry(error).sentence)));
    }
    EXPECT_THAT(errorBody(Error::methodNotAllowed), Not(HasSubstr("could not answer")));
    EXPECT_THAT(errorBody(Error::rangeNotSatisfiable), HasSubstr("Open the link again"));
}

TEST(HomePage, SaysWhatThisIs)
{
    const Response page = homePage({});
    EXPECT_EQ(page.status, 200);
    EXPECT_THAT(page.body, HasSubstr("<h1>From person to person</h1>"));
    EXPECT_THAT(page.body, Not(HasSubstr("<a ")));
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
            const std::string text = shownIn(landingPage(record, "TOKEN", language, now).body);
            EXPECT_THAT(text, Not(HasSubstr("%"))) << catalogue.tag << count;
            EXPECT_THAT(text, HasSubstr("+4915112345678")) << catalogue.tag << count;
            EXPECT_THAT(text, HasSubstr("2025")) << catalogue.tag;
            record.share.files.assign(count, {"a", "", 7, 0, "", ""});
            record.share.files.push_back({"b", "", 7, 7, "", "k"});
            const std::string lossy = shownIn(landingPage(record, "TOKEN", language, now).body);
            EXPECT_THAT(lossy, Not(HasSubstr("%"))) << catalogue.tag << count;
        }
    }
}

TEST(PageLanguage, NoPageMixesInEnglish)
{
    std::vector<FileRecord> files(2, {"a", "", 7, 7, "", "k"});
    files.push_back({"a", "", 7, 0, "", ""});
    for (const PageCatalogue &catalogue : pageCatalogues()) {
        const PageLanguage language = PageLanguage::preferred(catalogue.tag);
        const std::string page = pageOf(files, language);
        for (const char *words : {"files from", "in all", "Available", "Download all", "hours left",
                                  "Shared with", "Somebody", "more file", "Lost:"})
            EXPECT_THAT(page, Not(HasSubstr(words))) << catalogue.tag;
        EXPECT_THAT(homePage(language).body, Not(HasSubstr("erson to"))) << catalogue.tag;
        for (const Error error : errorsOfPages) {
            const std::string own = errorBody(error, language);
            for (const char *words : {"the link", "The time", "No longer", "the sender", "Too many",
                                      "is busy", "not work", "Nothing here", "could not answer",
                                      "is lost", "are lost", "any more"})
                EXPECT_THAT(own, Not(HasSubstr(words))) << catalogue.tag;
        }
    }
}

TEST(LandingPage, SpeaksTheReadersLanguage)
{
    const PageLanguage german = PageLanguage::preferred("de");
    const std::string page =
        pageOf({{"a.jpg", "", 1000, 1000, "", "k"}, {"b", "", 500, 500, "", "k"}}, german);
    EXPECT_THAT(page, HasSubstr("<html lang=\"de\" dir=\"ltr\">"));
    EXPECT_THAT(page, HasSubstr("2 Dateien von +4915112345678"));
    EXPECT_THAT(page, HasSubstr(">21.11.2025 14:05 UTC</time>"));
    EXPECT_THAT(page, HasSubstr("Noch 47 Stunden"));
    EXPECT_THAT(page, HasSubstr("Alles herunterladen (<bdi>1,5\u00a0kB</bdi>)"));
    const Response refused = errorPage(Refusal(Error::noSpace), german);
    EXPECT_THAT(refused.body, HasSubstr("Das hat nicht geklappt"));
    EXPECT_THAT(refused.body, HasSubstr("<p class=\"soft\" lang=\"en\" dir=\"ltr\">"));
}

TEST(LandingPage, RunsFromTheRightInArabicAndHebrew)
{
    for (const char *tag : {"ar", "he"}) {
        const std::string body =
            pageOf({{"a.jpg", "", 1500, 1500, "", "k"}}, PageLanguage::preferred(tag));
        EXPECT_THAT(body, HasSubstr(std::string("<html lang=\"") + tag + "\" dir=\"rtl\">"));
        // A plus sign at the wrong end would make another number of it.
        EXPECT_THAT(body, HasSubstr("\u2066+4915112345678\u2069"));
        EXPECT_THAT(body, HasSubstr("<bdi>a.jpg</bdi>"));
    }
}

} // namespace
} // namespace pelliko::server
