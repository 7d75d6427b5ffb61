#include "text/Escape.h"

#include <array>
#include <cstdio>
#include <ctime>

namespace pelliko::server
{
namespace
{

constexpr std::array<const char *, 12> months{"January",   "February", "March",    "April",
                                              "May",       "June",     "July",     "August",
                                              "September", "October",  "November", "December"};
constexpr std::array<const char *, 7> days{"Sun", "Mon", "Tue", "Wed", "Thu", "Fri", "Sat"};

std::tm utc(std::int64_t seconds)
{
    const std::time_t time = seconds;
    std::tm parts{};
    gmtime_r(&time, &parts);
    return parts;
}

/// The characters that RFC 5987 allows unescaped.
bool isAttributeCharacter(unsigned char c)
{
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') ||
           std::string_view("!#$&+-.^_`|~").find(static_cast<char>(c)) != std::string_view::npos;
}

std::size_t sequenceLength(unsigned char lead)
{
    if (lead < 0x80)
        return 1;
    if (lead >= 0xc2 && lead < 0xe0)
        return 2;
    if (lead >= 0xe0 && lead < 0xf0)
        return 3;
    return lead >= 0xf0 && lead < 0xf5 ? 4 : 0;
}

bool secondByteFits(unsigned char lead, unsigned char second)
{
    switch (lead) {
    case 0xe0:
        return second >= 0xa0;
    case 0xed:
        return second < 0xa0;
    case 0xf0:
        return second >= 0x90;
    case 0xf4:
        return second < 0x90;
    default:
        return true;
    }
}

} // namespace

std::string htmlEscape(std::string_view text)
{
    std::string out;
    for (char c : text) {
        switch (c) {
        case '&':
            out += "&amp;";
            break;
        case '<':
            out += "&lt;";
            break;
        case '>':
            out += "&gt;";
            break;
        case '"':
            out += "&quot;";
            break;
        case '\'':
            out += "&#39;";
            break;
        default:
            out.push_back(c);
        }
    }
    return out;
}

std::string attachmentDisposition(std::string_view name)
{
    std::string plain;
    std::string exact;
    for (char c : name) {
        const auto byte = static_cast<unsigned char>(c);
        // '%' too: some browsers decode it even in the plain form.
        const bool safe = byte >= 0x20 && byte < 0x7f && c != '"' && c != '\\' && c != '%';
        // One replacement for each character, not for each of its bytes.
        if ((byte & 0xc0U) != 0x80)
            plain.push_back(safe ? c : '_');
        if (isAttributeCharacter(byte)) {
            exact.push_back(c);
        } else {
            std::array<char, 4> hex{};
            std::snprintf(hex.data(), hex.size(), "%%%02X", byte);
            exact += hex.data();
        }
    }
    return "attachment; filename=\"" + plain + "\"; filename*=UTF-8''" + exact;
}

bool isUtf8(std::string_view text)
{
    for (std::size_t i = 0; i < text.size();) {
        const auto lead = static_cast<unsigned char>(text[i]);
        const std::size_t length = sequenceLength(lead);
        if (length == 0 || i + length > text.size())
            return false;
        for (std::size_t j = 1; j < length; ++j) {
            const auto next = static_cast<unsigned char>(text[i + j]);
            if ((next & 0xc0U) != 0x80 || (j == 1 && !secondByteFits(lead, next)))
                return false;
        }
        i += length;
    }
    return true;
}

std::string httpDate(std::int64_t secondsSinceEpoch)
{
    const std::tm t = utc(secondsSinceEpoch);
    std::array<char, 64> text{};
    std::snprintf(text.data(), text.size(), "%s, %02d %.3s %d %02d:%02d:%02d GMT",
                  days.at(static_cast<std::size_t>(t.tm_wday)), t.tm_mday,
                  months.at(static_cast<std::size_t>(t.tm_mon)), t.tm_year + 1900, t.tm_hour,
                  t.tm_min, t.tm_sec);
    return text.data();
}

std::string readableDate(std::int64_t secondsSinceEpoch)
{
    const std::tm t = utc(secondsSinceEpoch);
    std::array<char, 64> text{};
    std::snprintf(text.data(), text.size(), "%d %s %d, %02d:%02d UTC", t.tm_mday,
                  months.at(static_cast<std::size_t>(t.tm_mon)), t.tm_year + 1900, t.tm_hour,
                  t.tm_min);
    return text.data();
}

std::string isoDate(std::int64_t secondsSinceEpoch)
{
    const std::tm t = utc(secondsSinceEpoch);
    std::array<char, 64> text{};
    std::snprintf(text.data(), text.size(), "%04d-%02d-%02dT%02d:%02d:%02dZ", t.tm_year + 1900,
                  t.tm_mon + 1, t.tm_mday, t.tm_hour, t.tm_min, t.tm_sec);
    return text.data();
}

std::string readableSize(std::uint64_t bytes)
{
    if (bytes < 1000)
        return std::to_string(bytes) + (bytes == 1 ? " byte" : " bytes");
    constexpr std::array<const char *, 4> units{"kB", "MB", "GB", "TB"};
    double value = static_cast<double>(bytes) / 1000;
    std::size_t unit = 0;
    // 999.5 would be printed as 1000.
    while (value >= 999.5 && unit + 1 < units.size()) {
        value /= 1000;
        ++unit;
    }
    std::array<char, 32> text{};
    std::snprintf(text.data(), text.size(), value < 9.95 ? "%.1f %s" : "%.0f %s", value,
                  units.at(unit));
    return text.data();
}

} // namespace pelliko::server
