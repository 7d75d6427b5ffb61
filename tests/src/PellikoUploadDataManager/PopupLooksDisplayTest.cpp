// How the popups look on the screen that they get: run on several sizes of screens.
#include "PellikoUploadDataManager/PopupLooksScene.h"

#include <algorithm>
#include <sstream>

namespace pelliko::test
{
namespace
{

// What a person wants to look at, from the environment; without a wish the hardest of each.
std::vector<std::string> wished(const char *variable, const char *otherwise)
{
    const char *asked = getenv(variable);
    std::istringstream words(asked ? asked : otherwise);
    std::vector<std::string> found;
    for (std::string word; words >> word;)
        found.push_back(word);
    return found;
}

class EveryPopup : public PopupLooks
{
protected:
    void lookAtAll(const std::string &language, double scale, double letters)
    {
        elm_config_scale_set(scale);
        speak((language + ".UTF-8").c_str());
        for (const Variant &variant : variants()) {
            variant.open();
            layOut();
            std::ostringstream what;
            what << size << " scale " << scale << " letters " << letters << " " << language << " "
                 << variant.name;
            expectNothingCut(what.str());
            keepPictureOf(variant, language, scale, letters);
            closePopups();
        }
    }

    void keepPictureOf(const Variant &variant, const std::string &language, double scale,
                       double letters)
    {
        if (!getenv("PELLIKO_KEEP_PICTURES"))
            return;
        waitForFrames(150); // it fades in
        std::ostringstream name;
        name << "looks-" << size << "-" << scale << "-" << letters << "-" << language << "-"
             << variant.name;
        photograph(name.str());
    }
};

TEST_F(EveryPopup, IsWholeInEveryLanguageAndSize)
{
    if (!getenv("PELLIKO_KEEP_PICTURES"))
        ecore_evas_manual_render_set(ecore_evas_ecore_evas_get(evas_object_evas_get(ad->win)),
                                     EINA_TRUE);
    DesktopWish wish;
    for (const std::string &letters : wished("PELLIKO_LOOKS_LETTERS", "1.3")) {
        enlargeTexts(wish, std::stod(letters));
        for (const std::string &scale : wished("PELLIKO_LOOKS_SCALES", "2.5"))
            for (const std::string &language : wished("PELLIKO_LOOKS_LANGUAGES", "de ar"))
                lookAtAll(language, std::stod(scale), std::stod(letters));
    }
}

TEST_F(PopupLooks, CardIsAsWideAsAPhoneButNotAsADesk)
{
    share(1, 1500, {{"Anna Müller", true}});
    _createPopupView(ad);
    layOut();
    const Box window = boxOf(ad->win), left = boxOf(button("button1")),
              right = boxOf(button("button2"));
    EXPECT_NEAR(right.x + right.width - left.x, std::min(window.width, 560) - 2 * 24, 4);
    EXPECT_NEAR(left.x, window.width - right.x - right.width, 4);
    expectNothingCut("single");
}

TEST_F(PopupLooks, NoScreenIsNarrowerThanASmallPhone)
{
    elm_config_scale_set(5);
    openShare(ACTION_UPLOAD, 1);
    const Box window = boxOf(ad->win);
    const double least = std::min(window.width, window.height) / 320.0;
    EXPECT_NEAR(elm_object_scale_get(ad->popup) * 5, std::min(least, 5.0), 0.01);
    layOut();
    expectNothingCut("huge");
}

TEST_F(PopupLooks, WhatIsTooHighScrollsBetweenTitleAndButtons)
{
    elm_config_scale_set(2.5);
    openShare(ACTION_UPLOAD, 10, 12);
    layOut();
    Evas_Object *scroller = ad->popup_layout;
    while (strcmp(elm_object_widget_type_get(scroller), "Elm_Scroller") != 0)
        scroller = elm_object_parent_widget_get(scroller);
    const Box room = boxOf(scroller), content = boxOf(ad->popup_layout);
    expectInside(scroller, "middle");
    EXPECT_LE(room.y + room.height, boxOf(button("button1")).y);
    EXPECT_GE(content.height, room.height);
    // The keyboard brings into view what it acts on.
    elm_object_focus_set(ad->wifi_check_box, EINA_TRUE);
    EXPECT_TRUE(waitUntil([&] {
        const Box box = boxOf(ad->wifi_check_box);
        return box.y >= room.y - 1 && box.y + box.height <= room.y + room.height + 1;
    }));
}

TEST_F(PopupLooks, TwoNamesAreShownWhole)
{
    share(3, 5 << 20, {{"Mara Lindqvist", true}, {"Jonas Okonkwo"}});
    _createPopupView(ad);
    layOut();
    EXPECT_EQ(cutTexts(evas_object_evas_get(ad->win), {}), std::vector<std::string>());
}

TEST_F(PopupLooks, LongNamesAreShortenedAndTheRowScrolls)
{
    openShare(ACTION_UPLOAD, 10);
    layOut();
    ASSERT_EQ(items().size(), 10U);
    const int width = boxOf(items().front()).width;
    EXPECT_NEAR(width, 108, 2);
    EXPECT_FALSE(cutTexts(evas_object_evas_get(ad->win), {}).empty());
    expectNothingCut("ten");
}

TEST_F(PopupLooks, ProgressLeavesRoomForTheCancelButton)
{
    for (const char *language : {"de_DE.UTF-8", "ar.UTF-8"}) {
        speak(language);
        openStatus(3, 1);
        layOut();
        const bool mirrored = elm_config_mirrored_get();
        EXPECT_EQ(mirrored, language == std::string("ar.UTF-8"));
        const Box bar = boxOf(ad->progressbar), cancel = boxOf(ad->cancel_button);
        const Box &first = mirrored ? cancel : bar, &second = mirrored ? bar : cancel;
        EXPECT_LE(first.x + first.width, second.x) << language;
        EXPECT_GT(bar.width, 96);
        closePopups();
    }
}

} // namespace
} // namespace pelliko::test
