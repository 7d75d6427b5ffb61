#include "pages/ErrorPage.h"

#include "pages/PageFrame.h"
#include "pages/PageIcons.h"
#include "text/Escape.h"

namespace pelliko::server
{
namespace
{

struct ErrorWords {
    Mark mark;
    const char *heading;
    const char *text;
    /// Whether the refusal's own sentence, which is English, tells more.
    bool hasDetails;
};

ErrorWords wordsByStatus(int status)
{
    if (status == 429)
        return {Mark::clock, "Too many requests",
                "Many requests came from your connection. Wait a few minutes, then open the link "
                "again.",
                false};
    if (status >= 500)
        return {Mark::trouble, "This did not work", "The server could not answer. Try again later.",
                true};
    return {Mark::trouble, "This did not work",
            "Your browser asked for something that cannot be given. Open the link again as it "
            "stands in the message.",
            true};
}

ErrorWords wordsOf(const ErrorEntry &entry)
{
    switch (entry.error) {
    case Error::notFound:
        return {
            Mark::question, "Nothing here",
            "This link is not known. Check that it was copied completely, or ask the sender for "
            "a new one.",
            false};
    case Error::expired:
        return {
            Mark::clock, "The time is over",
            "What was shared here could be downloaded for a limited time, which has passed. Ask "
            "the sender to share it again.",
            false};
    case Error::withdrawn:
        return {Mark::takenBack, "No longer shared",
                "The sender has taken this share back, so it cannot be downloaded any more. If you "
                "still need it, ask the sender.",
                false};
    case Error::fileLost:
        return {Mark::trouble, "This file is lost",
                "The server does not have this file any more. Ask the sender to share it again.",
                false};
    case Error::filesLost:
        return {Mark::trouble, "These files are lost",
                "The server does not have these files any more. Ask the sender to share them "
                "again.",
                false};
    case Error::busy:
        return {Mark::clock, "The server is busy",
                "It has more to do than it can manage at the moment. Wait a few minutes, then open "
                "the link again.",
                false};
    default:
        return wordsByStatus(entry.status);
    }
}

std::string details(const PageLanguage &language, const Refusal &refusal)
{
    if (language.isEnglish())
        return paragraph(refusal.what());
    return "<p class=\"soft\" lang=\"en\" dir=\"ltr\">" + htmlEscape(refusal.what()) + "</p>\n";
}

} // namespace

Response errorPage(const Refusal &refusal, const PageLanguage &language)
{
    const ErrorWords words = wordsOf(refusal.entry());
    PageContent content;
    content.mark = "<span class=\"disc state\">" + iconOf(words.mark) + "</span>\n";
    content.heading = language.text(words.heading);
    content.content = paragraph(language.text(words.text));
    if (words.hasDetails)
        content.content += details(language, refusal);
    content.title = content.heading;
    content.preview = language.text(words.text);
    Response response = pageResponse(refusal.entry().status, language, content);
    for (const Header &header : refusal.headers())
        response.headers.push_back(header);
    return response;
}

} // namespace pelliko::server
