#include "Theme.h"

#include "CText.h"

#include <app_common.h>
#include <dlog.h>
#include <uxt_theme.h>

#include <string>
#include <unistd.h>

namespace pelliko::companion
{
namespace
{

constexpr const char *logTag = "COMPANION";

void extendTheme(const std::string &file)
{
    if (access(file.c_str(), R_OK) != 0)
        dlog_print(DLOG_ERROR, logTag, "no theme: %s", file.c_str());
    elm_theme_extension_add(nullptr, file.c_str());
}

} // namespace

void useTheme()
{
    const CText resources(app_get_resource_path());
    const CText shared(app_get_shared_resource_path());
    if (!resources || !shared)
        return;
    extendTheme(std::string(resources.get()) + "edje/pelliko.edj");
    extendTheme(std::string(resources.get()) + "edje/companion.edj");
    const std::string tables = std::string(shared.get()) + "tables/com.velmora.pelliko_";
    uxt_theme_set_changeable_ui_enabled(EINA_TRUE);
    uxt_theme_set_color_table(
        uxt_theme_add_color_table((tables + "ChangeableColorTable.xml").c_str()));
    uxt_theme_set_font_table(uxt_theme_add_font_table((tables + "FontInfoTable.xml").c_str()));
}

int scaled(int pixels)
{
    return ELM_SCALE_SIZE(pixels);
}

} // namespace pelliko::companion
