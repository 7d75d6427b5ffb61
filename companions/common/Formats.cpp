#include "Formats.h"

#include <array>
#include <clocale>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <langinfo.h>

namespace pelliko::companion
{
namespace
{

constexpr int64_t step = 1000;

// The plain locales write dates as computers did in 1970.
bool isPlain(const char *locale)
{
    return !locale || std::strcmp(locale, "POSIX") == 0 || std::strcmp(locale, "C") == 0 ||
           std::strncmp(locale, "C.", 2) == 0;
}

} // namespace

std::string sizeText(int64_t bytes)
{
    static constexpr std::array units{"B", "kB", "MB", "GB", "TB"};
    if (bytes < step)
        return std::to_string(bytes < 0 ? 0 : bytes) + " " + units[0];
    // Rounded to a tenth before the unit is chosen, so that 999,999 is not "1000.0 kB".
    size_t unit = 0;
    double value = static_cast<double>(bytes);
    while (value >= static_cast<double>(step) - 0.05 && unit + 1 < units.size()) {
        value /= static_cast<double>(step);
        unit += 1;
    }
    std::array<char, 32> text{};
    std::snprintf(text.data(), text.size(), "%.1f %s", value, units[unit]);
    return text.data();
}

std::string dateText(int64_t seconds, const char *fallback)
{
    const auto when = static_cast<time_t>(seconds);
    tm parts{};
    if (!localtime_r(&when, &parts))
        return {};
    const bool plain = isPlain(setlocale(LC_TIME, nullptr));
    const std::string format =
        plain ? std::string(fallback) : std::string(nl_langinfo(D_FMT)) + ", %H:%M";
    std::array<char, 128> text{};
    // The format is the locale's or the catalogue's: it is known when the program runs.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wformat-nonliteral"
    const size_t length = strftime(text.data(), text.size(), format.c_str(), &parts);
#pragma GCC diagnostic pop
    return {text.data(), length};
}

} // namespace pelliko::companion
