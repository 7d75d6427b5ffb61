// Languages that are written from right to left.
#include "PellikoUploadDataManager/PopupLooksScene.h"

namespace pelliko::test
{
namespace
{

TEST_F(PopupLooks, ArabicAndHebrewBeginAtTheRight)
{
    for (const char *language : {"ar.UTF-8", "he_IL.UTF-8"}) {
        speak(language);
        share(3, 5 << 20, {{"Mara Lindqvist", true}, {"Jonas Okonkwo"}});
        _createPopupView(ad);
        layOut();
        const Box check = boxOf(ad->wifi_check_box),
                  words = boxOf(part(ad->popup_layout, "elm.text"));
        EXPECT_LE(words.x + words.width, check.x) << language;
        EXPECT_GT(boxOf(items().front()).x, boxOf(items().back()).x) << language;
        EXPECT_GT(boxOf(button("button1")).x, boxOf(button("button2")).x) << language;
        closePopups();
    }
}

TEST_F(PopupLooks, ProgressGrowsTowardsTheEndOfTheLine)
{
    for (const char *language : {"en_GB.UTF-8", "ar.UTF-8"}) {
        speak(language);
        openStatus(3, 1);
        elm_progressbar_value_set(ad->progressbar, 0.25);
        layOut();
        const Box track = boxOf(part(ad->progressbar, "track")),
                  fill = boxOf(part(ad->progressbar, "fill"));
        EXPECT_NEAR(fill.width, track.width / 4, track.width / 12) << language;
        if (elm_config_mirrored_get())
            EXPECT_EQ(fill.x + fill.width, track.x + track.width);
        else
            EXPECT_EQ(fill.x, track.x);
        closePopups();
    }
}

TEST_F(PopupLooks, OpenPopupTurnsRoundWithItsLanguage)
{
    share(3, 5 << 20, {{"Mara Lindqvist", true}, {"Jonas Okonkwo"}});
    _createPopupView(ad);
    layOut();
    EXPECT_LT(boxOf(button("button1")).x, boxOf(button("button2")).x);
    speak("ar.UTF-8");
    layOut();
    EXPECT_GT(boxOf(button("button1")).x, boxOf(button("button2")).x);
    EXPECT_GT(boxOf(ad->wifi_check_box).x, boxOf(part(ad->popup_layout, "elm.text")).x);
}

} // namespace
} // namespace pelliko::test
