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
std::string nameOf(const FileRecord &file)
{
    return "<bdi>" + htmlEscape(file.name) + "</bdi>";
}

/// What both kinds of line begin with; `name` and `about` are markup.
std::string lineOf(FileKind kind, const std::string &name, const std::string &about)
{
    return "<span class=\"disc\">" + iconOf(kind) +
           "</span><span class=\"file\"><span class=\"name\">" + name + "</span> " + about +
           "</span>";
}

std::string fileItem(const PageLanguage &language, const FileRecord &file,
                     const std::string &address)
{
    const FileKind kind = kindOf(file.name, file.type);
    const std::string about = "<span class=\"kind\">" + htmlEscape(language.text(wordFor(kind))) +
                              "</span><span class=\"size\"><bdi>" +
                              htmlEscape(language.size(file.size)) + "</bdi></span>";
    return "<li><a href=\"" + htmlEscape(address) + "\" download>" +
           lineOf(kind, nameOf(file), about) + "<span class=\"get\">" + iconOf(Mark::download) +
           "</span></a></li>\n";
}

/// Leads nowhere. Its kind is not told: the sentence agrees with the word for a file.
std::string lostItem(const PageLanguage &language, const FileRecord &file)
{
    const std::string about = language.text("Lost: ask the sender to share it again.");
    return "<li><div class=\"lost\">" +
           lineOf(kindOf(file.name, file.type), "<s>" + nameOf(file) + "</s>",
                  "<span class=\"size\">" + htmlEscape(about) + "</span>") +
           "</div></li>\n";
}

/// What of a share the page lists, and what of it can be had.
struct Listing {
    std::string items;
    std::size_t lost = 0;
    std::vector<std::string> addresses;
    std::uint64_t bytes = 0;
};

Listing listingOf(const PageLanguage &language, const ShareRecord &share, const std::string &token)
{
    Listing listing;
    for (std::size_t index = 0; index < share.files.size(); ++index) {
        const FileRecord &file = share.files[index];
        if (share.lost(file)) {
            listing.items += lostItem(language, file);
            ++listing.lost;
            continue;
        }
        listing.addresses.push_back(token + "/" + std::to_string(index));
        listing.items += fileItem(language, file, listing.addresses.back());
        listing.bytes += file.size;
    }
    return listing;
}

std::string headingOf(const PageLanguage &language, const std::string &sender, std::size_t count)
{
    return withValue(language.counted("%1$d file from %2$s", "%1$d files from %2$s", count), "%2$s",
                     sender);
}

/// Who saves everything at once does not look through the list.
std::string lossOf(const PageLanguage &language, std::size_t count)
{
    if (count == 0)
        return {};
    return "<p>" +
           htmlEscape(language.counted("%d more file is lost", "%d more files are lost", count)) +
           "</p>\n";
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
    const Listing listing = listingOf(language, link.share, token);
    const bool single = listing.addresses.size() == 1;
    const std::string size = language.size(listing.bytes);
    PageContent content;
    content.heading = text ? language.filled("Text from %s", link.senderNumber)
                           : headingOf(language, link.senderNumber, listing.addresses.size());
    content.content =
        (text ? textBlock(*text) : std::string()) + lossOf(language, listing.lost) +
        paragraph(single ? size : language.filled("%s in all", size)) +
        endOf(language, link.share.deadline, now) +
        button(language, single ? listing.addresses.front() : token + "/all.zip", single, size) +
        "<ul role=\"list\">\n" + listing.items + "</ul>\n";
    content.title = language.text("Shared with you");
    content.preview =
        language.text("Somebody shared something with you. The link works for a limited time.");
    return pageResponse(static_cast<int>(Status::ok), language, content);
}

} // namespace pelliko::server
