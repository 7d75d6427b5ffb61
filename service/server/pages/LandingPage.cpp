#include "pages/LandingPage.h"

#include "pages/PageStyle.h"
#include "text/Base64.h"
#include "text/Escape.h"
#include "text/Secrets.h"

#include <utility>

namespace pelliko::server
{
namespace
{

std::vector<Header> pageHeaders(const PageLanguage &language)
{
    static const std::string policy =
        "default-src 'none'; style-src 'sha256-" + base64(sha256(pageStyle)) +
        "'; base-uri 'none'; form-action 'none'; frame-ancestors 'none'";
    return {{"Content-Type", "text/html; charset=utf-8"},
            {"Content-Language", language.tag()},
            {"Content-Security-Policy", policy},
            {"Vary", "Accept-Language"},
            {"Cache-Control", "private, no-store"}};
}

std::string page(const PageLanguage &language, const std::string &title, const std::string &content)
{
    return std::string("<!DOCTYPE html>\n<html lang=\"") + language.tag() + "\" dir=\"" +
           language.direction() +
           "\">\n<head>\n<meta charset=\"utf-8\">\n"
           "<meta name=\"viewport\" content=\"width=device-width, initial-scale=1\">\n"
           "<meta name=\"robots\" content=\"noindex, nofollow\">\n<title>" +
           htmlEscape(title) + "</title>\n<style>" + pageStyle +
           "</style>\n</head>\n<body>\n<main>\n<p class=\"brand\">Pelliko</p>\n"
           "<div class=\"card\">\n" +
           content + "</div>\n</main>\n</body>\n</html>\n";
}

std::string paragraph(const std::string &text)
{
    return "<p class=\"soft\">" + htmlEscape(text) + "</p>\n";
}

/// A name's own letters say which way it runs, whatever the page does.
std::string fileItem(const PageLanguage &language, const FileRecord &file,
                     const std::string &address)
{
    return "<li><a href=\"" + htmlEscape(address) +
           "\" download><span class=\"name\" dir=\"auto\">" + htmlEscape(file.name) +
           "</span><span class=\"size\"><bdi>" + htmlEscape(language.size(file.size)) +
           "</bdi></span></a></li>\n";
}

std::string titleOf(const PageLanguage &language, const LinkRecord &link)
{
    return withValue(
        language.counted("%1$d file from %2$s", "%1$d files from %2$s", link.share.files.size()),
        "%2$s", link.senderNumber);
}

const char *headingOf(Error error)
{
    switch (error) {
    case Error::notFound:
        return "Nothing here";
    case Error::gone:
        return "No longer available";
    default:
        return "This did not work";
    }
}

/// What a reader can do about a refusal. The details are English; in another language they follow a
/// sentence that everybody can read.
std::string explanationOf(const PageLanguage &language, const Refusal &refusal)
{
    switch (refusal.entry().error) {
    case Error::notFound:
        return paragraph(language.text("This link is not known. Check that it was copied "
                                       "completely, or ask the sender for a new one."));
    case Error::gone:
        return paragraph(language.text(
            "The files behind this link have expired or were withdrawn by the sender. They are no "
            "longer stored here; ask the sender to share them again."));
    default:
        if (language.isEnglish())
            return paragraph(refusal.what());
        return paragraph(language.text("The server could not answer. Try again later.")) +
               "<p class=\"soft\" lang=\"en\" dir=\"ltr\">" + htmlEscape(refusal.what()) + "</p>\n";
    }
}

std::string endOf(const PageLanguage &language, Seconds deadline)
{
    // The date stands in the sentence as an element, so the sentence is made around a mark.
    const std::string sentence = htmlEscape(language.filled("Available until %s", "\n"));
    return "<p class=\"soft\">" +
           withValue(sentence, "\n",
                     "<time datetime=\"" + isoDate(deadline) + "\">" +
                         htmlEscape(language.date(deadline)) + "</time>") +
           "</p>\n";
}

std::string button(const PageLanguage &language, const std::string &address, bool single,
                   const std::string &size)
{
    const char *label = single ? "Download (%s)" : "Download all (%s)";
    return "<a class=\"button\" href=\"" + htmlEscape(address) + "\" download>" +
           htmlEscape(language.filled(label, size)) + "</a>\n";
}

} // namespace

PageLanguage languageOf(const Request &request)
{
    const std::string *wishes = request.header("Accept-Language");
    return wishes ? PageLanguage::preferred(*wishes) : PageLanguage();
}

Response landingPage(const LinkRecord &link, const std::string &token, const PageLanguage &language)
{
    const std::vector<FileRecord> &files = link.share.files;
    std::uint64_t total = 0;
    std::string items;
    for (std::size_t index = 0; index < files.size(); ++index) {
        total += files[index].size;
        items += fileItem(language, files[index], token + "/" + std::to_string(index));
    }
    const bool single = files.size() == 1;
    const std::string size = language.size(total);
    const std::string title = titleOf(language, link);
    const std::string content =
        "<h1>" + htmlEscape(title) + "</h1>\n" +
        paragraph(single ? size : language.filled("%s in all", size)) +
        endOf(language, link.share.deadline) +
        button(language, token + (single ? "/0" : "/all.zip"), single, size) + "<ul>\n" + items +
        "</ul>\n";
    return makeResponse(Status::ok, pageHeaders(language), page(language, title, content));
}

Response errorPage(const Refusal &refusal, const PageLanguage &language)
{
    const std::string heading = language.text(headingOf(refusal.entry().error));
    Response response;
    response.status = refusal.entry().status;
    response.headers = pageHeaders(language);
    for (const Header &header : refusal.headers())
        response.headers.push_back(header);
    response.body =
        page(language, heading,
             "<h1>" + htmlEscape(heading) + "</h1>\n" + explanationOf(language, refusal));
    return response;
}

} // namespace pelliko::server
