#include "pages/LandingPage.h"

#include "pages/FileKind.h"
#include "pages/PageFrame.h"
#include "pages/PageIcons.h"
#include "text/Escape.h"

namespace pelliko::server
{
namespace
{

constexpr Seconds hour = 3600;

/// A name's own letters say which way it runs; it begins where the lines of the page begin.
std::string fileItem(const PageLanguage &language, const FileRecord &file,
                     const std::string &address)
{
    const FileKind kind = kindOf(file.name, file.type);
    return "<li><a href=\"" + htmlEscape(address) + "\" download><span class=\"disc\">" +
           iconOf(kind) + "</span><span class=\"file\"><span class=\"name\"><bdi>" +
           htmlEscape(file.name) + "</bdi></span> <span class=\"kind\">" +
           htmlEscape(language.text(wordFor(kind))) + "</span><span class=\"size\"><bdi>" +
           htmlEscape(language.size(file.size)) + "</bdi></span></span><span class=\"get\">" +
           iconOf(Mark::download) + "</span></a></li>\n";
}

std::string headingOf(const PageLanguage &language, const LinkRecord &link, bool isText)
{
    if (isText)
        return language.filled("Text from %s", link.senderNumber);
    return withValue(
        language.counted("%1$d file from %2$s", "%1$d files from %2$s", link.share.files.size()),
        "%2$s", link.senderNumber);
}

/// The text with its "%s" replaced by an element, which keeps together what is in it.
std::string around(const PageLanguage &language, const char *english, const std::string &element)
{
    return withValue(htmlEscape(language.filled(english, "\n")), "\n", element);
}

/// A page without script cannot know the reader's time zone, so the date is in UTC and what is left
/// of the time stands beside it.
std::string endOf(const PageLanguage &language, Seconds deadline, Seconds now)
{
    const Seconds hours = deadline > now ? (deadline - now) / hour : 0;
    return "<p class=\"soft\">" +
           around(language, "Available until %s",
                  "<time datetime=\"" + isoDate(deadline) + "\">" +
                      htmlEscape(language.date(deadline)) + "</time>") +
           "</p>\n" +
           paragraph(hours > 0 ? language.counted("%d hour left", "%d hours left",
                                                  static_cast<std::uint64_t>(hours))
                               : language.text("Less than an hour left"));
}

std::string button(const PageLanguage &language, const std::string &address, bool single,
                   const std::string &size)
{
    return "<a class=\"button\" href=\"" + htmlEscape(address) + "\" download>" +
           iconOf(Mark::download) + "<span>" +
           around(language, single ? "Download (%s)" : "Download all (%s)",
                  "<bdi>" + htmlEscape(size) + "</bdi>") +
           "</span></a>\n";
}

std::string textBlock(const std::string &text)
{
    return "<div class=\"text\" dir=\"auto\">" + htmlEscape(text) + "</div>\n";
}

} // namespace

PageLanguage languageOf(const Request &request)
{
    const std::string *wishes = request.header("Accept-Language");
    return wishes ? PageLanguage::preferred(*wishes) : PageLanguage();
}

Response landingPage(const LinkRecord &link, const std::string &token, const PageLanguage &language,
                     Seconds now, const std::optional<std::string> &text)
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
    PageContent content;
    content.heading = headingOf(language, link, text.has_value());
    content.content = (text ? textBlock(*text) : std::string()) +
                      paragraph(single ? size : language.filled("%s in all", size)) +
                      endOf(language, link.share.deadline, now) +
                      button(language, token + (single ? "/0" : "/all.zip"), single, size) +
                      "<ul role=\"list\">\n" + items + "</ul>\n";
    content.title = language.text("Shared with you");
    content.preview =
        language.text("Somebody shared something with you. The link works for a limited time.");
    return pageResponse(static_cast<int>(Status::ok), language, content);
}

} // namespace pelliko::server
