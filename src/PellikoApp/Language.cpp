#include "PellikoApp/Language.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/AppData.h"
#include "PellikoApp/CText.h"
#include "PellikoUploadDataManager/PopupLanguage.h"

#include <Elementary.h>
#include <algorithm>
#include <app_common.h>
#include <array>
#include <clocale>
#include <cstdlib>
#include <cstring>
#include <libintl.h>
#include <string>
#include <string_view>
#include <vconf-keys.h>
#include <vconf.h>

namespace pelliko
{

namespace
{

constexpr const char *domain = "pelliko";
// The environment's spelling and the one that is asked for as a locale differ.
constexpr const char *defaultEnvironment = "en_GB.utf8";
constexpr const char *defaultLanguage = "en_GB.UTF-8";

void _setEnvironment(const char *language)
{
    setenv("LANG", language, 1);
    setenv("LC_MESSAGES", language, 1);
    // Wins over both in the look-up of texts; a language without a catalogue falls back to English.
    setenv("LANGUAGE", (std::string(language) + ":en").c_str(), 1);
}

std::string _deviceLanguage()
{
    const CText language(vconf_get_str(VCONFKEY_LANGSET));
    _setEnvironment(language ? language.get() : defaultEnvironment);
    return language ? language.get() : defaultLanguage;
}

int _bindCatalogue(const char *name, const char *dir)
{
    if (!bindtextdomain(name, dir))
        return -1;
    LOG_DEBUG("_initI18n bindtextdomain domain = %s", name);
    // The toolkit takes UTF-8 only, whatever the locale's own encoding is.
    bind_textdomain_codeset(name, "UTF-8");
    if (!textdomain(name))
        return -1;
    LOG_DEBUG("_initI18n textdomain domain = %s", name);
    return 0;
}

// "C", "POSIX" or "C.UTF-8": no language at all.
bool _isBareLocale(const char *locale)
{
    return !locale || strcmp(locale, "POSIX") == 0 ||
           (locale[0] == 'C' && (locale[1] == '\0' || locale[1] == '.'));
}

// Message ids must never reach the user. The C locale translates nothing, so where the language's
// locale is not installed C.UTF-8 stands in: under it LANGUAGE chooses the catalogue.
void _translateWithoutLocale(const char *dir, const std::string &language)
{
    LOG_DEBUG("locale %s is not installed, its texts are used without it", language.c_str());
    // Texts that were looked up are kept until the locale changes, and it was this one already if
    // the language before had no locale either.
    setlocale(LC_ALL, "C");
    setlocale(LC_ALL, "C.UTF-8");
    _bindCatalogue(domain, dir);
}

// Written from right to left, by the two letters that a locale begins with.
bool _isRightToLeft(const std::string &language)
{
    constexpr std::array<std::string_view, 7> languages{"ar", "fa", "he", "iw", "ps", "ur", "yi"};
    const std::string_view begin =
        std::string_view(language).substr(0, language.find_first_of("_.@"));
    return std::find(languages.begin(), languages.end(), begin) != languages.end();
}

} // namespace

void _langChanged(app_event_info_h, void *data)
{
    auto *ad = static_cast<PellikoAppData *>(data);
    const std::string language = _deviceLanguage();
    LOG_DEBUG("Current Lang : %s", language.c_str());
    const CText resources(app_get_resource_path());
    const std::string dir = std::string(resources ? resources.get() : "") + "locale";
    if (_initI18n(domain, dir.c_str(), language.c_str()) != 0 ||
        _isBareLocale(setlocale(LC_MESSAGES, nullptr)))
        _translateWithoutLocale(dir.c_str(), language);
    elm_language_set(language.c_str());
    // The toolkit would ask its own catalogue, which knows only installed locales.
    elm_config_mirrored_set(_isRightToLeft(language));
    if (ad && ad->popup)
        updatePopupLanguage(ad);
}

int _initI18n(const char *name, const char *dir, const char *locale)
{
    if (!setlocale(LC_ALL, "")) {
        LOG_DEBUG("_initI18n setlocale failed for the environment");
        if (!setlocale(LC_ALL, locale))
            return -1;
    }
    LOG_DEBUG("_initI18n setlocale = %s", setlocale(LC_ALL, nullptr));
    return _bindCatalogue(name, dir);
}

} // namespace pelliko
