#include "pages/LandingPage.h"

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
                    "TOKEN")
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
    const std::string body = landingPage(link({{"a.jpg", "", 1, 1, "", "k"}}), "TOKEN").body;
    EXPECT_THAT(body, HasSubstr("1 file from"));
    EXPECT_THAT(body, Not(HasSubstr("all.zip")));
}

TEST(LandingPage, NamesCannotBecomeMarkup)
{
    const std::string body =
        landingPage(link({{"<img src=x onerror=\"a\">.jpg", "", 1, 1, "", "k"}}), "TOKEN").body;
    EXPECT_THAT(body, Not(HasSubstr("<img")));
    EXPECT_THAT(body, HasSubstr("&lt;img src=x onerror=&quot;a&quot;&gt;.jpg"));
}

TEST(LandingPage, EndedAndUnknownLinksSayWhy)
{
    const Response gone = errorPage(Refusal(Error::gone));
    EXPECT_EQ(gone.status, 410);
    EXPECT_THAT(gone.body, HasSubstr("No longer available"));
    const Response unknown = errorPage(Refusal(Error::notFound));
    EXPECT_EQ(unknown.status, 404);
    EXPECT_THAT(unknown.body, HasSubstr("This link is not known"));
}

} // namespace
} // namespace pelliko::server
