#include "ChangeableUi.h"
#include "DesktopSettings.h"
#include "TableReader.h"
#include "uxt_theme.h"

#include <array>
#include <map>
#include <string>
#include <vector>

namespace
{

struct ColorClass {
    std::string name;
    int red = 0, green = 0, blue = 0, alpha = 255;
};

using Palette = std::vector<ColorClass>;

constexpr std::array<const char *, 3> wishes{"", "light", "dark"};

// "#rrggbb" or "#rrggbbaa".
bool parseColor(const std::string &text, ColorClass &color)
{
    if ((text.size() != 7 && text.size() != 9) || text[0] != '#' ||
        text.find_first_not_of("0123456789abcdefABCDEF", 1) != std::string::npos)
        return false;
    const unsigned long value = std::stoul(text.substr(1, 6), nullptr, 16);
    color.red = static_cast<int>(value >> 16 & 0xff);
    color.green = static_cast<int>(value >> 8 & 0xff);
    color.blue = static_cast<int>(value & 0xff);
    if (text.size() == 9)
        color.alpha = static_cast<int>(std::stoul(text.substr(7), nullptr, 16));
    return true;
}

// False when one entry has no name or no colour.
bool readPalette(const std::vector<pelliko::ui::TableEntry> &entries, Palette &palette)
{
    for (const auto &entry : entries) {
        ColorClass color;
        color.name = entry.get("class");
        if (color.name.empty() || !parseColor(entry.get("value"), color))
            return false;
        palette.push_back(std::move(color));
    }
    return true;
}

} // namespace

struct _Uxt_Color_Table {
    std::map<std::string, Palette> palettes; ///< by what the user may wish for
    Palette applied = {};                    ///< while in use
};

namespace
{

Uxt_Color_Table *inUse = nullptr;

void apply(Uxt_Color_Table &table)
{
    const auto wished = table.palettes.find(pelliko::ui::wishedPalette());
    table.applied = (wished == table.palettes.end() ? table.palettes.begin() : wished)->second;
    for (const ColorClass &c : table.applied)
        edje_color_class_set(c.name.c_str(), c.red, c.green, c.blue, c.alpha, 0, 0, 0, 0, 0, 0, 0,
                             0);
}

// The one in use follows the user, also while its colours are on the screen.
void applyAgain()
{
    if (inUse)
        apply(*inUse);
}

} // namespace

Uxt_Color_Table *uxt_theme_add_color_table(const char *xml_path)
{
    const auto file = pelliko::ui::readTable(xml_path, "color-table", "color");
    if (!file)
        return nullptr;
    Uxt_Color_Table table;
    for (const char *wish : wishes) {
        if (readPalette(file->of(wish), table.palettes[wish]))
            continue;
        pelliko::ui::reportTable(xml_path, "a <color> needs class and value=\"#rrggbb[aa]\"");
        return nullptr;
    }
    return new Uxt_Color_Table(std::move(table));
}

Eina_Bool uxt_theme_set_color_table(Uxt_Color_Table *table)
{
    if (!table || !pelliko::ui::changeableUiEnabled())
        return EINA_FALSE;
    inUse = table;
    apply(*table);
    pelliko::ui::watchDesktopSettings(applyAgain);
    return EINA_TRUE;
}

void uxt_theme_release_color_table(Uxt_Color_Table *table)
{
    if (table && table == inUse) {
        inUse = nullptr;
        for (const ColorClass &c : table->applied)
            edje_color_class_del(c.name.c_str());
    }
    delete table;
}

Eina_Bool uxt_theme_get_color(const char *color_class, int *r, int *g, int *b, int *a)
{
    if (!color_class || !inUse)
        return EINA_FALSE;
    for (const ColorClass &c : inUse->applied) {
        if (c.name != color_class)
            continue;
        if (r)
            *r = c.red;
        if (g)
            *g = c.green;
        if (b)
            *b = c.blue;
        if (a)
            *a = c.alpha;
        return EINA_TRUE;
    }
    return EINA_FALSE;
}
