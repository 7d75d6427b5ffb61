#include "pages/PageLanguage.h"

#include "pages/PageCatalogues.h"
#include "text/Escape.h"

#include <algorithm>
#include <cctype>
#include <ctime>
#include <iomanip>
#include <sstream>
#include <utility>
#include <vector>

namespace pelliko::server
{
namespace
{

/// More entries than a browser sends; the rest of an endless header is not looked at.
constexpr std::size_t maxWishes = 32;

struct Wish {
    std::string tag;   ///< in lower case
    int weight = 1000; ///< thousandths
};

std::string_view trimmed(std::string_view text)
{
    while (!text.empty() && (text.front() == ' ' || text.front() == '\t'))
        text.remove_prefix(1);
    while (!text.empty() && (text.back() == ' ' || text.back() == '\t'))
        text.remove_suffix(1);
    return text;
}

/// "0.8" is 800; what is no weight counts as none at all.
int weightOf(std::string_view text)
{
    if (text.empty() || (text[0] != '0' && text[0] != '1') || (text.size() > 1 && text[1] != '.'))
        return 0;
    int weight = (text[0] - '0') * 1000;
    int worth = 100;
    for (const char digit : text.substr(std::min<std::size_t>(text.size(), 2))) {
        if (digit < '0' || digit > '9')
            return 0;
        weight += (digit - '0') * worth;
        worth /= 10;
    }
    return std::min(weight, 1000);
}

Wish wishOf(std::string_view entry)
{
    Wish wish;
    const auto semicolon = entry.find(';');
    for (const char c : trimmed(entry.substr(0, semicolon)))
        wish.tag.push_back(static_cast<char>(std::tolower(static_cast<unsigned char>(c))));
    if (semicolon == std::string_view::npos)
        return wish;
    const std::string_view parameter = trimmed(entry.substr(semicolon + 1));
    if (parameter.substr(0, 2) == "q=")
        wish.weight = weightOf(parameter.substr(2));
    return wish;
}

/// In the reader's order of liking.
std::vector<Wish> wishesOf(std::string_view header)
{
    std::vector<Wish> wishes;
    while (!header.empty() && wishes.size() < maxWishes) {
        const auto comma = header.find(',');
        Wish wish = wishOf(header.substr(0, comma));
        if (!wish.tag.empty() && wish.weight > 0)
            wishes.push_back(std::move(wish));
        header = comma == std::string_view::npos ? std::string_view() : header.substr(comma + 1);
    }
    std::stable_sort(wishes.begin(), wishes.end(),
                     [](const Wish &a, const Wish &b) { return a.weight > b.weight; });
    return wishes;
}

bool hasPart(const std::string &tag, const char *part)
{
    return (tag + "-").find("-" + std::string(part) + "-") != std::string::npos;
}

/// Chinese is written in two ways; regions stand for one of them where no script is named.
const char *chineseFor(const std::string &tag)
{
    if (hasPart(tag, "hans"))
        return "zh-CN";
    const bool traditional =
        hasPart(tag, "hant") || hasPart(tag, "tw") || hasPart(tag, "hk") || hasPart(tag, "mo");
    return traditional ? "zh-TW" : "zh-CN";
}

std::string primaryOf(std::string_view tag)
{
    std::string primary(tag.substr(0, tag.find('-')));
    // Codes that old browsers still send.
    if (primary == "iw")
        return "he";
    return primary == "in" ? "id" : primary;
}

bool isEnglishFor(const std::string &tag)
{
    return tag == "*" || primaryOf(tag) == "en";
}

const PageCatalogue *catalogueFor(const std::string &tag)
{
    const std::string primary = primaryOf(tag);
    for (const PageCatalogue &catalogue : pageCatalogues()) {
        if (primary == "zh" ? std::string_view(catalogue.tag) == chineseFor(tag)
                            : primaryOf(catalogue.tag) == primary)
            return &catalogue;
    }
    return nullptr;
}

const PageText *find(const PageCatalogue *catalogue, std::string_view id)
{
    if (!catalogue)
        return nullptr;
    const auto found = std::find_if(catalogue->texts.begin(), catalogue->texts.end(),
                                    [&](const PageText &text) { return id == text.id; });
    return found == catalogue->texts.end() ? nullptr : &*found;
}

} // namespace

PageLanguage PageLanguage::preferred(std::string_view acceptLanguage)
{
    for (const Wish &wish : wishesOf(acceptLanguage)) {
        if (isEnglishFor(wish.tag))
            break;
        if (const PageCatalogue *catalogue = catalogueFor(wish.tag))
            return PageLanguage(catalogue);
    }
    return {};
}

const char *PageLanguage::tag() const
{
    return m_catalogue ? m_catalogue->tag : "en";
}

const char *PageLanguage::direction() const
{
    return m_catalogue && m_catalogue->rightToLeft ? "rtl" : "ltr";
}

std::string PageLanguage::text(const char *english) const
{
    const PageText *found = find(m_catalogue, english);
    return found ? found->forms[0] : english;
}

std::string PageLanguage::filled(const char *english, std::string_view value) const
{
    return withValue(text(english), "%s", value);
}

std::string PageLanguage::counted(const char *one, const char *many, std::uint64_t number) const
{
    const PageText *found = find(m_catalogue, one);
    const char *form =
        found ? found->forms[m_catalogue->formOf(number)] : (number == 1 ? one : many);
    const std::string digits = std::to_string(number);
    return withValue(withValue(form, "%d", digits), "%1$d", digits);
}

std::string PageLanguage::size(std::uint64_t bytes) const
{
    if (bytes < 1000)
        return counted("%d byte", "%d bytes", bytes);
    const std::string english = readableSize(bytes);
    const auto space = english.find(' ');
    const PageText *sign = find(m_catalogue, "decimal sign\004.");
    const std::string number =
        withValue(english.substr(0, space), ".", sign ? sign->forms[0] : ".");
    return filled(("%s" + english.substr(space)).c_str(), number);
}

std::string PageLanguage::date(std::int64_t secondsSinceEpoch) const
{
    if (isEnglish())
        return readableDate(secondsSinceEpoch);
    const std::time_t time = secondsSinceEpoch;
    std::tm parts{};
    gmtime_r(&time, &parts);
    const std::string format = text("%Y-%m-%d %H:%M UTC");
    std::ostringstream written;
    written << std::put_time(&parts, format.c_str());
    return written.str();
}

std::string withValue(std::string text, std::string_view place, std::string_view value)
{
    if (const auto found = text.find(place); found != std::string::npos)
        text.replace(found, place.size(), value);
    return text;
}

} // namespace pelliko::server
