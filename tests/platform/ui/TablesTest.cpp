#include "uxt_button.h"
#include "uxt_theme.h"

#include <cstdlib>
#include <fstream>
#include <functional>
#include <gio/gio.h>
#include <gtest/gtest.h>
#include <string>

namespace
{

class Tables : public ::testing::Test
{
protected:
    static void SetUpTestSuite()
    {
        setenv("GSETTINGS_BACKEND", "keyfile", 1); // once for the process
        elm_init(0, nullptr);
    }
    Tables() { uxt_theme_set_changeable_ui_enabled(EINA_TRUE); }

    static std::string file(const std::string &text)
    {
        static int number = 0;
        const std::string path = "/tmp/table" + std::to_string(++number) + ".xml";
        std::ofstream(path) << text;
        return path;
    }
    static Uxt_Color_Table *colors(const std::string &text)
    {
        return uxt_theme_add_color_table(file(text).c_str());
    }
    static Uxt_Font_Table *fonts(const std::string &text)
    {
        return uxt_theme_add_font_table(file(text).c_str());
    }
    static std::string colorOf(const char *name)
    {
        int r = -1, g = -1, b = -1, a = -1;
        if (!uxt_theme_get_color(name, &r, &g, &b, &a))
            return r == -1 && a == -1 ? "unknown" : "unknown, but written";
        return std::to_string(r) + "," + std::to_string(g) + "," + std::to_string(b) + "," +
               std::to_string(a);
    }
    // What layouts are drawn with.
    static std::string drawnColor(const char *name)
    {
        int r = -1, g = -1, b = -1, a = -1, unused = 0;
        edje_color_class_get(name, &r, &g, &b, &a, &unused, &unused, &unused, &unused, &unused,
                             &unused, &unused, &unused);
        return std::to_string(r) + "," + std::to_string(g) + "," + std::to_string(b) + "," +
               std::to_string(a);
    }
};

constexpr const char *twoPalettes =
    "<color-table palette='dark'><palette name='light'><color class='X' value='#ffffff'/>"
    "</palette><palette name='dark'><color class='X' value='#102030'/></palette>"
    "<color class='Y' value='#0a0B0c80'/></color-table>";

TEST_F(Tables, SetColorsDriveTheLayouts)
{
    Uxt_Color_Table *table = colors(twoPalettes);
    ASSERT_NE(table, nullptr);
    EXPECT_EQ(colorOf("X"), "unknown");
    EXPECT_TRUE(uxt_theme_set_color_table(table));
    EXPECT_EQ(colorOf("X"), "16,32,48,255");
    EXPECT_EQ(colorOf("Y"), "10,11,12,128");
    EXPECT_EQ(drawnColor("X"), "16,32,48,255");
    EXPECT_EQ(colorOf("Z"), "unknown");
    uxt_theme_release_color_table(table);
    EXPECT_EQ(colorOf("X"), "unknown");
    EXPECT_NE(drawnColor("X"), "16,32,48,255");
}

// Another program changes what the user wants, as a desktop's settings do.
class Wishes : public Tables
{
protected:
    static void set(const std::string &key, const std::string &value)
    {
        EXPECT_EQ(
            system(("gsettings set org.gnome.desktop.interface " + key + " " + value).c_str()), 0);
    }

    static bool waitUntil(const std::function<bool()> &condition)
    {
        bool late = false;
        const guint limit = g_timeout_add_seconds(
            20,
            [](void *data) -> gboolean {
                *static_cast<bool *>(data) = true;
                return G_SOURCE_CONTINUE;
            },
            &late);
        while (!condition() && !late)
            g_main_context_iteration(nullptr, TRUE);
        g_source_remove(limit);
        return !late;
    }
};

TEST_F(Wishes, ForDarkOrLightChooseThePalette)
{
    Uxt_Color_Table *table = colors(
        "<color-table palette='light'><palette name='light'><color class='X' value='#ffffff'/>"
        "</palette><palette name='dark'><color class='X' "
        "value='#102030'/></palette></color-table>");
    EXPECT_TRUE(uxt_theme_set_color_table(table));
    EXPECT_EQ(colorOf("X"), "255,255,255,255");
    set("color-scheme", "prefer-dark");
    EXPECT_TRUE(waitUntil([] { return colorOf("X") == "16,32,48,255"; }));
    EXPECT_EQ(drawnColor("X"), "16,32,48,255");
    setenv("PELLIKO_COLOR_SCHEME", "light", 1);
    EXPECT_TRUE(uxt_theme_set_color_table(table));
    unsetenv("PELLIKO_COLOR_SCHEME");
    EXPECT_EQ(colorOf("X"), "255,255,255,255");
    set("color-scheme", "default");
    uxt_theme_release_color_table(table);
}

TEST_F(Wishes, ForLargerTextsEnlargeTheFonts)
{
    Uxt_Font_Table *table =
        fonts("<font-table><font class='F' family='Sans' size='20'/></font-table>");
    EXPECT_TRUE(uxt_theme_set_font_table(table));
    const auto sizeOf = [] {
        const char *font = nullptr;
        Evas_Font_Size size = 0;
        edje_text_class_get("F", &font, &size);
        return size;
    };
    EXPECT_EQ(sizeOf(), 20);
    set("text-scaling-factor", "1.25");
    EXPECT_TRUE(waitUntil([&] { return sizeOf() == 25; }));
    set("text-scaling-factor", "1.0");
    EXPECT_TRUE(waitUntil([&] { return sizeOf() == 20; }));
    uxt_theme_release_font_table(table);
}

TEST_F(Tables, SetFontsDriveTheLayouts)
{
    Uxt_Font_Table *table =
        fonts("<font-table><font class='F' family='Noto Sans:style=Bold' size='17'/></font-table>");
    ASSERT_NE(table, nullptr);
    EXPECT_TRUE(uxt_theme_set_font_table(table));
    const char *font = nullptr;
    Evas_Font_Size size = 0;
    EXPECT_TRUE(edje_text_class_get("F", &font, &size));
    EXPECT_STREQ(font, "Noto Sans:style=Bold");
    EXPECT_EQ(size, 17);
    uxt_theme_release_font_table(table);
}

TEST_F(Tables, NothingIsSetWithoutATableOrWhileDisabled)
{
    EXPECT_FALSE(uxt_theme_set_color_table(nullptr));
    EXPECT_FALSE(uxt_theme_set_font_table(nullptr));
    Uxt_Color_Table *table = colors(twoPalettes);
    uxt_theme_set_changeable_ui_enabled(EINA_FALSE);
    EXPECT_FALSE(uxt_theme_set_color_table(table));
    EXPECT_EQ(colorOf("X"), "unknown");
    uxt_theme_release_color_table(table);
    uxt_theme_release_color_table(nullptr);
    uxt_theme_release_font_table(nullptr);
}

TEST_F(Tables, BrokenFilesAreRefusedAsAWhole)
{
    EXPECT_EQ(uxt_theme_add_color_table(nullptr), nullptr);
    EXPECT_EQ(uxt_theme_add_color_table("/nowhere.xml"), nullptr);
    EXPECT_EQ(colors(""), nullptr);
    EXPECT_EQ(colors("<color-table><color class='X' value='#ffffff'/>"), nullptr);
    EXPECT_EQ(colors("<other/>"), nullptr);
    EXPECT_EQ(colors("<color-table><colour class='X' value='#ffffff'/></color-table>"), nullptr);
    EXPECT_EQ(colors("<color-table><color class='X' value='white'/></color-table>"), nullptr);
    EXPECT_EQ(colors("<color-table><color class='X' value='#12345'/></color-table>"), nullptr);
    EXPECT_EQ(colors("<color-table><color value='#ffffff'/></color-table>"), nullptr);
    EXPECT_EQ(fonts("<font-table><font class='F' family='Sans' size='big'/></font-table>"),
              nullptr);
    EXPECT_EQ(fonts("<font-table><font class='F' size='12'/></font-table>"), nullptr);
}

TEST_F(Tables, ButtonIsAWidgetAndNeedsAParent)
{
    EXPECT_EQ(uxt_button_add(nullptr), nullptr);
    Evas_Object *win = elm_win_util_standard_add("tables", "tables");
    EXPECT_STREQ(elm_object_widget_type_get(uxt_button_add(win)), "Elm_Button");
    evas_object_del(win);
}

} // namespace
