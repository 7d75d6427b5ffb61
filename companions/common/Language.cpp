#include "Language.h"

#include "CText.h"

#include <Elementary.h>
#include <app.h>
#include <app_common.h>
#include <vconf-keys.h>
#include <vconf.h>

#include <algorithm>
#include <array>
#include <clocale>
#include <cstdlib>
#include <cstring>
#include <libintl.h>
#include <string_view>

namespace pelliko::companion
{
namespace
{

struct Language {
    const char *catalogue = "";
    void (*changed)(void *) = nullptr;
    void *data = nullptr;
};

Language &language()
{
    static Language kept;
    return kept;
}

// Written from right to left, by what a locale begins with.
bool isRightToLeft(const std::string &language)
{
    constexpr std::array<std::string_view, 7> languages{"ar", "fa", "he", "iw", "ps", "ur", "yi"};
    const std::string_view begin =
        std::string_view(language).substr(0, language.find_first_of("_.@"));
    return std::find(languages.begin(), languages.end(), begin) != languages.end();
}

// Message catalogues are looked up by LANGUAGE as soon as the locale is any but "C".
void applyLanguage()
{
    const CText name(vconf_get_str(VCONFKEY_LANGSET));
    if (name) {
        setenv("LANG", name.get(), 1);
        setenv("LANGUAGE", (std::string(name.get()) + ":en").c_str(), 1);
    }
    const char *locale = setlocale(LC_ALL, "");
    if (!locale || std::strcmp(setlocale(LC_MESSAGES, nullptr), "C") == 0) {
        // Texts that were looked up are kept until the locale changes.
        setlocale(LC_ALL, "C");
        setlocale(LC_ALL, "C.UTF-8");
    }
    elm_language_set(name ? name.get() : "");
    // The toolkit would ask its own catalogue, which knows only installed locales.
    elm_config_mirrored_set(name && isRightToLeft(name.get()) ? EINA_TRUE : EINA_FALSE);
}

void onLanguage(app_event_info_h, void *)
{
    applyLanguage();
    if (language().changed)
        language().changed(language().data);
}

std::string replaced(std::string text, const char *place, const std::string &value)
{
    if (const auto found = text.find(place); found != std::string::npos)
        text.replace(found, std::strlen(place), value);
    return text;
}

} // namespace

void useLanguage(const char *catalogue, void (*changed)(void *data), void *data)
{
    language() = {catalogue, changed, data};
    const CText resources(app_get_resource_path());
    const std::string folder = std::string(resources ? resources.get() : "") + "locale";
    bindtextdomain(catalogue, folder.c_str());
    bind_textdomain_codeset(catalogue, "UTF-8");
    textdomain(catalogue);
    applyLanguage();
    app_event_handler_h handler = nullptr;
    ui_app_add_event_handler(&handler, APP_EVENT_LANGUAGE_CHANGED, onLanguage, nullptr);
}

const char *textDomain()
{
    return language().catalogue;
}

const char *translated(const char *text)
{
    return *text ? dgettext(textDomain(), text) : "";
}

std::string counted(const char *one, const char *many, unsigned long number)
{
    return replaced(dngettext(textDomain(), one, many, number), "%d", std::to_string(number));
}

std::string filledIn(const char *text, const std::string &value)
{
    constexpr const char *isolateBegin = "\u2068";
    constexpr const char *isolateEnd = "\u2069";
    return replaced(translated(text), "%s", isolateBegin + value + isolateEnd);
}

} // namespace pelliko::companion
