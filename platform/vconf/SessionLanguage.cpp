#include "SessionLanguage.h"

#include "vconf-keys.h"

#include <cstdlib>

namespace pelliko::vconf
{

namespace
{

// "de_AT.iso88591@euro" is "de_AT": texts are always UTF-8 here, and no catalogue goes by a
// variant.
std::string languageOf(const std::string &locale)
{
    return locale.substr(0, locale.find_first_of(".@"));
}

bool isLanguage(const std::string &name)
{
    return !name.empty() && name != "C" && name != "POSIX" && name.find('/') == std::string::npos;
}

std::string sessionLocale()
{
    for (const char *variable : {"LC_ALL", "LC_MESSAGES", "LANG"}) {
        const char *value = getenv(variable);
        if (value && *value)
            return value;
    }
    return {};
}

std::string firstWish()
{
    const char *wishes = getenv("LANGUAGE");
    const std::string list = wishes ? wishes : "";
    return languageOf(list.substr(0, list.find(':')));
}

// "de" is what "de_AT" says already, and says less.
bool isPartOf(const std::string &wish, const std::string &language)
{
    return language.rfind(wish + "_", 0) == 0;
}

} // namespace

bool namesLanguage(const std::string &key)
{
    return key == VCONFKEY_LANGSET;
}

std::optional<std::string> sessionLanguage()
{
    std::string language = languageOf(sessionLocale());
    if (!isLanguage(language))
        return std::nullopt;
    const std::string wish = firstWish();
    if (isLanguage(wish) && !isPartOf(wish, language))
        language = wish;
    return language + ".UTF-8";
}

} // namespace pelliko::vconf
