#include "ChangeableUi.h"
#include "TableReader.h"
#include "uxt_theme.h"

#include <cstdint>
#include <string>
#include <vector>

namespace
{

struct ColorClass {
    std::string name;
    int red = 0, green = 0, blue = 0, alpha = 255;
};

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

} // namespace

struct _Uxt_Color_Table {
    std::vector<ColorClass> classes;
};

namespace
{
Uxt_Color_Table *inUse = nullptr;
}

Uxt_Color_Table *uxt_theme_add_color_table(const char *xml_path)
{
    const auto entries = pelliko::ui::readTable(xml_path, "color-table", "color");
    if (!entries)
        return nullptr;
    Uxt_Color_Table table;
    for (const auto &entry : *entries) {
        ColorClass color;
        color.name = entry.get("class");
        if (color.name.empty() || !parseColor(entry.get("value"), color)) {
            pelliko::ui::reportTable(xml_path, "a <color> needs class and value=\"#rrggbb[aa]\"");
            return nullptr;
        }
        table.classes.push_back(std::move(color));
    }
    return new Uxt_Color_Table(std::move(table));
}

Eina_Bool uxt_theme_set_color_table(Uxt_Color_Table *table)
{
    if (!table || !pelliko::ui::changeableUiEnabled())
        return EINA_FALSE;
    inUse = table;
    for (const ColorClass &c : table->classes)
        edje_color_class_set(c.name.c_str(), c.red, c.green, c.blue, c.alpha, 0, 0, 0, 0, 0, 0, 0,
                             0);
    return EINA_TRUE;
}

void uxt_theme_release_color_table(Uxt_Color_Table *table)
{
    if (table && table == inUse) {
        inUse = nullptr;
        for (const ColorClass &c : table->classes)
            edje_color_class_del(c.name.c_str());
    }
    delete table;
}

Eina_Bool uxt_theme_get_color(const char *color_class, int *r, int *g, int *b, int *a)
{
    if (!color_class || !inUse)
        return EINA_FALSE;
    for (const ColorClass &c : inUse->classes) {
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
