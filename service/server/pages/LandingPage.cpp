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

std::vector<Header> pageHeaders()
{
    static const std::string policy =
        "default-src 'none'; style-src 'sha256-" + base64(sha256(pageStyle)) +
        "'; base-uri 'none'; form-action 'none'; frame-ancestors 'none'";
    return {{"Content-Type", "text/html; charset=utf-8"},
            {"Content-Security-Policy", policy},
            {"Cache-Control", "private, no-store"}};
}

std::string page(const std::string &title, const std::string &content)
{
    return "<!DOCTYPE html>\n<html lang=\"en\">\n<head>\n<meta charset=\"utf-8\">\n"
           "<meta name=\"viewport\" content=\"width=device-width, initial-scale=1\">\n"
           "<meta name=\"robots\" content=\"noindex, nofollow\">\n<title>" +
           htmlEscape(title) + "</title>\n<style>" + pageStyle +
           "</style>\n</head>\n<body>\n<main>\n<p class=\"brand\">Pelliko</p>\n"
           "<div class=\"card\">\n" +
           content + "</div>\n</main>\n</body>\n</html>\n";
}

std::string fileItem(const FileRecord &file, const std::string &address)
{
    return "<li><a href=\"" + htmlEscape(address) + "\" download><span class=\"name\">" +
           htmlEscape(file.name) + "</span><span class=\"size\">" + readableSize(file.size) +
           "</span></a></li>\n";
}

std::string countText(std::size_t count)
{
    return std::to_string(count) + (count == 1 ? " file" : " files");
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

const char *explanationOf(const Refusal &refusal)
{
    switch (refusal.entry().error) {
    case Error::notFound:
        return "This link is not known. Check that it was copied completely, or ask the sender "
               "for a new one.";
    case Error::gone:
        return "The files behind this link have expired or were withdrawn by the sender. They are "
               "no longer stored here; ask the sender to share them again.";
    default:
        return refusal.what();
    }
}

} // namespace

Response landingPage(const LinkRecord &link, const std::string &token)
{
    const std::vector<FileRecord> &files = link.share.files;
    std::uint64_t total = 0;
    std::string items;
    for (std::size_t index = 0; index < files.size(); ++index) {
        total += files[index].size;
        items += fileItem(files[index], token + "/" + std::to_string(index));
    }
    const bool single = files.size() == 1;
    const std::string all = token + (single ? "/0" : "/all.zip");
    const std::string size = readableSize(total);
    const std::string title = countText(files.size()) + " from " + link.senderNumber;
    const Seconds deadline = link.share.deadline;
    const std::string content =
        "<h1>" + htmlEscape(title) + "</h1>\n<p class=\"soft\">" + size +
        (single ? "" : " in all") + "</p>\n<p class=\"soft\">Available until <time datetime=\"" +
        isoDate(deadline) + "\">" + readableDate(deadline) + "</time></p>\n" +
        "<a class=\"button\" href=\"" + htmlEscape(all) + "\" download>" +
        (single ? "Download" : "Download all") + " (" + size + ")</a>\n<ul>\n" + items + "</ul>\n";
    return makeResponse(Status::ok, pageHeaders(), page(title, content));
}

Response errorPage(const Refusal &refusal)
{
    const std::string heading = headingOf(refusal.entry().error);
    Response response;
    response.status = refusal.entry().status;
    response.headers = pageHeaders();
    for (const Header &header : refusal.headers())
        response.headers.push_back(header);
    response.body = page(heading, "<h1>" + heading + "</h1>\n<p class=\"soft\">" +
                                      htmlEscape(explanationOf(refusal)) + "</p>\n");
    return response;
}

} // namespace pelliko::server
