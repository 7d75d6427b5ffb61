// The table of colours: what it drives, light and dark, and whether everybody can read it.
#include "PellikoUploadDataManager/PopupLooksScene.h"

#include <cstdio>
#include <fstream>
#include <regex>
#include <sstream>
#include <uxt_theme.h>

namespace pelliko::test
{
namespace
{

constexpr const char *table = "/opt/usr/apps/com.velmora.pelliko/shared/res/tables/"
                              "com.velmora.pelliko_ChangeableColorTable.xml";

struct Color {
    int r = -1, g = -1, b = -1;
    bool operator==(const Color &) const = default;
};

Color colorOf(const std::string &name)
{
    Color color;
    EXPECT_TRUE(uxt_theme_get_color(name.c_str(), &color.r, &color.g, &color.b, nullptr)) << name;
    return color;
}

double part(int value)
{
    const double s = value / 255.0;
    return s <= 0.04045 ? s / 12.92 : std::pow((s + 0.055) / 1.055, 2.4);
}

double luminance(const Color &color)
{
    return 0.2126 * part(color.r) + 0.7152 * part(color.g) + 0.0722 * part(color.b);
}

// As the Web Content Accessibility Guidelines measure it: 1 to 21.
double contrast(const Color &one, const Color &other)
{
    const double a = luminance(one), b = luminance(other);
    return (std::max(a, b) + 0.05) / (std::min(a, b) + 0.05);
}

struct Pair {
    const char *front;
    std::vector<const char *> grounds;
};

const std::vector<Pair> texts = {
    {"pelliko/text", {"pelliko/card", "pelliko/row", "pelliko/row/pressed"}},
    {"pelliko/text/second", {"pelliko/card", "pelliko/row", "pelliko/row/pressed"}},
    {"pelliko/error", {"pelliko/card"}},
    {"pelliko/primary/text", {"pelliko/primary", "pelliko/primary/pressed"}},
    {"pelliko/button/text", {"pelliko/button", "pelliko/button/pressed"}},
    {"pelliko/person/text",
     {"pelliko/person/1", "pelliko/person/2", "pelliko/person/3", "pelliko/person/4",
      "pelliko/person/5"}},
    {"/fg/normal/popup/text", {"pelliko/card"}},
    {"/fg/normal/entry/text", {"/bg/normal/entry", "/bg/normal/entry/selection"}},
    {"/fg/normal/entry/text/guide", {"/bg/normal/entry"}}};

const std::vector<Pair> shapes = {
    {"pelliko/focus", {"pelliko/card"}},
    {"pelliko/check/off", {"pelliko/row", "pelliko/row/pressed", "pelliko/card", "pelliko/line"}},
    {"pelliko/check/on", {"pelliko/row", "pelliko/row/pressed"}},
    {"pelliko/check/mark", {"pelliko/check/on"}},
    {"pelliko/primary", {"pelliko/card", "pelliko/line"}},
    {"AO004", {"pelliko/card"}},
    {"/fg/normal/entry", {"/bg/normal/entry", "pelliko/card"}},
    {"/fg/normal/entry/cursor", {"/bg/normal/entry"}},
    {"/fg/normal/progress/pulse", {"/bg/normal/progress/base"}}};

void expectContrast(const std::vector<Pair> &pairs, double least)
{
    for (const Pair &pair : pairs)
        for (const char *ground : pair.grounds)
            EXPECT_GE(contrast(colorOf(pair.front), colorOf(ground)), least)
                << pair.front << " on " << ground;
}

// The default picture is drawn in shades of grey, and the table's colour multiplied into them.
void expectPersonToBeSeen()
{
    constexpr double shade = 0x71 / 255.0;
    const Color ground = colorOf("AO003L1");
    const auto shaded = [](int value) { return static_cast<int>(value * shade); };
    EXPECT_GE(contrast(ground, {shaded(ground.r), shaded(ground.g), shaded(ground.b)}), 3.0);
}

class Colors : public PopupLooks
{
protected:
    static std::string tableText()
    {
        std::ostringstream text;
        text << std::ifstream(table).rdbuf();
        return text.str();
    }

    // What the screen shows between the title and the card's edge.
    Color cardOnScreen()
    {
        const Box left = boxOf(button("button1"));
        const std::string command = "import -window root -crop 1x1+" + std::to_string(left.x - 12) +
                                    "+" + std::to_string(left.y) +
                                    " -depth 8 txt:- | grep -o '#[0-9A-F]\\{6\\}'";
        FILE *pipe = popen(command.c_str(), "r");
        Color color;
        unsigned int value = 0;
        if (fscanf(pipe, "#%x", &value) == 1)
            color = {static_cast<int>(value >> 16 & 0xff), static_cast<int>(value >> 8 & 0xff),
                     static_cast<int>(value & 0xff)};
        pclose(pipe);
        return color;
    }

    void openOnScreen()
    {
        share(1, 1500, {{"Ann Example", true}});
        _createPopupView(ad);
        ASSERT_TRUE(settle(button("button1")));
    }

    // The compositor rounds.
    static bool isLike(const Color &one, const Color &other)
    {
        return std::abs(one.r - other.r) < 4 && std::abs(one.g - other.g) < 4 &&
               std::abs(one.b - other.b) < 4;
    }

    bool cardBecomes(const Color &color)
    {
        Color seen;
        for (int looks = 0; looks < 20 && !isLike(seen, color); ++looks) {
            EXPECT_TRUE(settle(button("button1")));
            seen = cardOnScreen();
        }
        return isLike(seen, color);
    }
};

TEST_F(Colors, OfTextsAndShapesStandOutFromTheirGrounds)
{
    expectContrast(texts, 4.5);
    expectContrast(shapes, 3.0);
    expectPersonToBeSeen();
    const Color light = colorOf("pelliko/card");
    DesktopWish wish;
    wish.dark();
    ASSERT_TRUE(waitUntil([&] { return colorOf("pelliko/card") != light; }));
    expectContrast(texts, 4.5);
    expectContrast(shapes, 3.0);
    expectPersonToBeSeen();
}

TEST_F(Colors, AreTheSameClassesInBothPalettes)
{
    const std::string text = tableText();
    const size_t dark = text.find("<palette name=\"dark\">");
    ASSERT_NE(dark, std::string::npos);
    const auto classes = [](const std::string &palette) {
        const std::regex name("class=\"([^\"]+)\"");
        std::vector<std::string> found;
        for (std::sregex_iterator at(palette.begin(), palette.end(), name), end; at != end; ++at)
            found.push_back((*at)[1]);
        return found;
    };
    EXPECT_GT(classes(text.substr(dark)).size(), 30U);
    EXPECT_EQ(classes(text.substr(0, dark)), classes(text.substr(dark)));
}

TEST_F(Colors, OfAnOpenPopupFollowTheDesktop)
{
    openOnScreen();
    EXPECT_TRUE(cardBecomes(colorOf("pelliko/card")));
    const Color light = colorOf("pelliko/card");
    DesktopWish wish;
    wish.dark();
    ASSERT_TRUE(waitUntil([&] { return colorOf("pelliko/card") != light; }));
    EXPECT_TRUE(cardBecomes(colorOf("pelliko/card")));
}

TEST_F(Colors, ComeFromTheTableAlone)
{
    const std::string usual = tableText();
    std::ofstream(table) << std::regex_replace(
        usual, std::regex("(\"pelliko/card\" value=\")#......"), "$01#2468ac");
    _changeableGuiInit(app.get(), ad);
    openOnScreen();
    EXPECT_TRUE(cardBecomes({0x24, 0x68, 0xac}));
    std::ofstream(table) << usual;
}

} // namespace
} // namespace pelliko::test
