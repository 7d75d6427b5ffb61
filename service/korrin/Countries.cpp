#include "Countries.h"

#include <glib.h>

#include <algorithm>
#include <map>

namespace pelliko::korrin
{
namespace
{

// Of the package mobile-broadband-provider-info.
constexpr const char *providers = "/usr/share/mobile-broadband-provider-info/serviceproviders.xml";

// How many networks of a country have a code.
using Networks = std::map<std::string, std::map<std::string, int>>;

struct Reading {
    Networks networks;
    std::string region;
};

const char *attribute(const char *wanted, const char **names, const char **values)
{
    for (; *names; ++names, ++values) {
        if (g_str_equal(*names, wanted))
            return *values;
    }
    return nullptr;
}

void startElement(GMarkupParseContext *, const char *element, const char **names,
                  const char **values, gpointer data, GError **)
{
    auto *reading = static_cast<Reading *>(data);
    if (g_str_equal(element, "country")) {
        const char *code = attribute("code", names, values);
        g_autofree char *region = g_ascii_strup(code ? code : "", -1);
        reading->region = region;
    } else if (g_str_equal(element, "network-id")) {
        const char *code = attribute("mcc", names, values);
        if (code && !reading->region.empty())
            ++reading->networks[reading->region][code];
    }
}

Networks readNetworks()
{
    Reading reading;
    g_autofree char *text = nullptr;
    gsize length = 0;
    g_autoptr(GError) error = nullptr;
    const GMarkupParser parser{startElement, nullptr, nullptr, nullptr, nullptr};
    g_autoptr(GMarkupParseContext) context =
        g_markup_parse_context_new(&parser, G_MARKUP_DEFAULT_FLAGS, &reading, nullptr);
    if (!g_file_get_contents(providers, &text, &length, &error) ||
        !g_markup_parse_context_parse(context, text, static_cast<gssize>(length), &error))
        g_warning("mobile country codes: %s", error->message);
    return std::move(reading.networks);
}

const Networks &networks()
{
    static const Networks read = readNetworks();
    return read;
}

} // namespace

std::string mobileCodeOf(const std::string &region)
{
    const auto found = networks().find(region);
    if (found == networks().end())
        return {};
    return std::max_element(found->second.begin(), found->second.end(),
                            [](const auto &a, const auto &b) { return a.second < b.second; })
        ->first;
}

std::string regionOfMobileCode(const std::string &mobileCode)
{
    // Some countries' lists hold a neighbour's network; the code is the one's who uses it most.
    std::string region;
    int most = 0;
    for (const auto &[country, codes] : networks()) {
        const auto code = codes.find(mobileCode);
        if (code != codes.end() && code->second > most) {
            most = code->second;
            region = country;
        }
    }
    return region;
}

} // namespace pelliko::korrin
