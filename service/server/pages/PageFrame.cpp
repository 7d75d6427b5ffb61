#include "pages/PageFrame.h"

#include "pages/PageIcons.h"
#include "pages/PageStyle.h"
#include "text/Base64.h"
#include "text/Escape.h"
#include "text/Secrets.h"

namespace pelliko::server
{
namespace
{

std::vector<Header> pageHeaders(const PageLanguage &language)
{
    // The one picture that is loaded is the icon in the tab, which stands in the page itself.
    static const std::string policy =
        "default-src 'none'; img-src data:; style-src 'sha256-" + base64(sha256(pageStyle)) +
        "'; base-uri 'none'; form-action 'none'; frame-ancestors 'none'";
    return {{"Content-Type", "text/html; charset=utf-8"},
            {"Content-Language", language.tag()},
            {"Content-Security-Policy", policy},
            {"Vary", "Accept-Language"},
            {"Cache-Control", "private, no-store"}};
}

std::string meta(const char *kind, const char *name, const std::string &content)
{
    return std::string("<meta ") + kind + "=\"" + name + "\" content=\"" + htmlEscape(content) +
           "\">\n";
}

std::string themeColour(const char *scheme, const char *colour)
{
    return std::string("<meta name=\"theme-color\" media=\"(prefers-color-scheme: ") + scheme +
           ")\" content=\"" + colour + "\">\n";
}

std::string headOf(const PageContent &content)
{
    return "<head>\n<meta charset=\"utf-8\">\n" +
           meta("name", "viewport", "width=device-width, initial-scale=1") +
           meta("name", "robots", "noindex, nofollow, noarchive") +
           meta("name", "referrer", "no-referrer") + meta("name", "color-scheme", "light dark") +
           themeColour("light", paperInLight) + themeColour("dark", paperInDark) + "<title>" +
           htmlEscape(content.title) + "</title>\n" + meta("name", "description", content.preview) +
           meta("property", "og:site_name", "Pelliko") + meta("property", "og:type", "website") +
           meta("property", "og:title", content.title) +
           meta("property", "og:description", content.preview) +
           "<link rel=\"icon\" type=\"image/svg+xml\" href=\"" + brandAddress() + "\">\n<style>" +
           pageStyle + "</style>\n</head>\n";
}

} // namespace

Response pageResponse(int status, const PageLanguage &language, const PageContent &content)
{
    Response response;
    response.status = status;
    response.headers = pageHeaders(language);
    response.body = std::string("<!DOCTYPE html>\n<html lang=\"") + language.tag() + "\" dir=\"" +
                    language.direction() + "\">\n" + headOf(content) +
                    "<body>\n<main>\n<p class=\"brand\">" + brandMark() +
                    "<span>Pelliko</span></p>\n<div class=\"card\">\n" + content.mark + "<h1>" +
                    htmlEscape(content.heading) + "</h1>\n" + content.content +
                    "</div>\n</main>\n</body>\n</html>\n";
    return response;
}

std::string paragraph(const std::string &text)
{
    return "<p class=\"soft\">" + htmlEscape(text) + "</p>\n";
}

} // namespace pelliko::server
