#include "ChangeableUi.h"
#include "DesktopSettings.h"
#include "TableReader.h"
#include "uxt_theme.h"

#include <cmath>
#include <cstdlib>
#include <string>
#include <vector>

namespace
{

struct FontClass {
    std::string name;
    std::string font; ///< family, perhaps with ":style=…"
    int size = 0;     ///< pixels at scale 1
};

} // namespace

struct _Uxt_Font_Table {
    std::vector<FontClass> classes;
};

namespace
{
Uxt_Font_Table *inUse = nullptr;
bool enabled = false;

void apply(const Uxt_Font_Table &table)
{
    const double scale = pelliko::ui::wishedTextScale();
    for (const FontClass &f : table.classes)
        edje_text_class_set(f.name.c_str(), f.font.c_str(),
                            static_cast<Evas_Font_Size>(std::lround(f.size * scale)));
}

// The one in use follows the user, also while its texts are on the screen.
void applyAgain()
{
    if (inUse)
        apply(*inUse);
}

} // namespace

bool pelliko::ui::changeableUiEnabled()
{
    return enabled;
}

void uxt_theme_set_changeable_ui_enabled(Eina_Bool enable)
{
    enabled = enable != EINA_FALSE;
}

Uxt_Font_Table *uxt_theme_add_font_table(const char *xml_path)
{
    const auto file = pelliko::ui::readTable(xml_path, "font-table", "font");
    if (!file)
        return nullptr;
    Uxt_Font_Table table;
    for (const auto &entry : file->of()) {
        const FontClass font{entry.get("class"), entry.get("family"),
                             std::atoi(entry.get("size").c_str())};
        if (font.name.empty() || font.font.empty() || font.size <= 0) {
            pelliko::ui::reportTable(xml_path, "a <font> needs class, family and size");
            return nullptr;
        }
        table.classes.push_back(font);
    }
    return new Uxt_Font_Table(std::move(table));
}

Eina_Bool uxt_theme_set_font_table(Uxt_Font_Table *table)
{
    if (!table || !enabled)
        return EINA_FALSE;
    inUse = table;
    apply(*table);
    pelliko::ui::watchDesktopSettings(applyAgain);
    return EINA_TRUE;
}

void uxt_theme_release_font_table(Uxt_Font_Table *table)
{
    if (table && table == inUse) {
        inUse = nullptr;
        for (const FontClass &f : table->classes)
            edje_text_class_del(f.name.c_str());
    }
    delete table;
}
