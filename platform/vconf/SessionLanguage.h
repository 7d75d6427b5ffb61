// Which language the session speaks, for as long as nobody chose one.
#pragma once

#include <optional>
#include <string>

namespace pelliko::vconf
{

/// Whether the key is the device language.
bool namesLanguage(const std::string &key);

/// What LC_ALL, LC_MESSAGES or LANG name, the first of them that is set, as the platform writes
/// languages: "fr_FR.UTF-8". A first entry of LANGUAGE goes before it, as it does for everybody
/// else's texts. Nothing for the locale "C", which is no language. Reads the environment.
std::optional<std::string> sessionLanguage();

} // namespace pelliko::vconf
