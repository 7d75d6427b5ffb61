#include "PellikoApp/Window.h"

#include "PellikoUploadManager/ExitPolicy.h"
#include "support/PopupScene.h"

#include <Ecore_X.h>
#include <efl_util.h>
#include <gmock/gmock.h>
#include <uxt_theme.h>

namespace pelliko
{
namespace
{

using Window = test::PopupScene;

TEST_F(Window, IsATransparentNotificationWindowOverTheScreen)
{
    EXPECT_EQ(elm_win_type_get(ad->win), ELM_WIN_NOTIFICATION);
    EXPECT_TRUE(elm_win_alpha_get(ad->win));
    EXPECT_STREQ(elm_win_title_get(ad->win), "pelliko");
    EXPECT_FALSE(elm_win_conformant_get(ad->win));
    EXPECT_TRUE(elm_win_autodel_get(ad->win));
    EXPECT_TRUE(evas_object_visible_get(ad->win));
    auto level = EFL_UTIL_NOTIFICATION_LEVEL_NONE;
    efl_util_get_notification_window_level(ad->win, &level);
    EXPECT_EQ(level, EFL_UTIL_NOTIFICATION_LEVEL_DEFAULT);
    EXPECT_EQ(boxOf(ad->win), (Box{0, 0, 480, 800}));
}

TEST_F(Window, NameAndClassAreThoseOfPopups)
{
    char *name = nullptr, *window_class = nullptr;
    ecore_x_icccm_name_class_get(elm_win_xwindow_get(ad->win), &name, &window_class);
    EXPECT_STREQ(name, "APP_POPUP");
    EXPECT_STREQ(window_class, "APP_POPUP");
    free(name);
    free(window_class);
}

TEST_F(Window, TablesDriveTheLayouts)
{
    int r = 0, g = 0, b = 0, a = 0;
    EXPECT_TRUE(uxt_theme_get_color("AO003L1", &r, &g, &b, &a));
    EXPECT_TRUE(uxt_theme_get_color("AO004", &r, &g, &b, &a));
    EXPECT_NE(ad->font_table, nullptr);
    EXPECT_THAT(log.messages(), ::testing::Contains("uxt_theme_set_color_table() is success."));
    releaseChangeableGui(ad);
    EXPECT_EQ(ad->color_table, nullptr);
    EXPECT_EQ(ad->font_table, nullptr);
    EXPECT_FALSE(uxt_theme_get_color("AO004", &r, &g, &b, &a));
    releaseChangeableGui(ad);
}

TEST_F(Window, DeletedWindowIsForgottenAndMadeAnewWhenNeeded)
{
    evas_object_del(ad->win);
    EXPECT_EQ(ad->win, nullptr);
    showMainWindow(ad);
    ensureMainWindow(app.get(), ad);
    ASSERT_NE(ad->win, nullptr);
    EXPECT_TRUE(evas_object_visible_get(ad->win));
}

TEST_F(Window, HiddenWindowIsShownAgainNotMadeAnew)
{
    const Evas_Object *win = ad->win;
    _hideWindow(ad);
    ensureMainWindow(app.get(), ad);
    EXPECT_EQ(ad->win, win);
    EXPECT_TRUE(evas_object_visible_get(ad->win));
}

TEST_F(Window, WindowThatGetsNoPopupIsHiddenAgain)
{
    turnLoopOnce();
    EXPECT_FALSE(evas_object_visible_get(ad->win));
    ensureMainWindow(app.get(), ad);
    EXPECT_TRUE(evas_object_visible_get(ad->win));
    turnLoopOnce();
    EXPECT_FALSE(evas_object_visible_get(ad->win));
}

TEST_F(Window, WindowThatGotAPopupStays)
{
    showMainWindow(ad);
    turnLoopOnce();
    EXPECT_TRUE(evas_object_visible_get(ad->win));
    ensureMainWindow(app.get(), ad); // another request while it is open
    turnLoopOnce();
    EXPECT_TRUE(evas_object_visible_get(ad->win));
}

TEST_F(Window, RotationWithoutARecordIsLogged)
{
    _rotationChangedCb(nullptr, ad->win, nullptr);
    EXPECT_EQ(log.messages().back(), "[ERROR][(ad == NULL)] Return message : data is NULL.");
    ad->rotation = 90;
    _rotationChangedCb(ad, ad->win, nullptr);
    EXPECT_EQ(ad->rotation, elm_win_rotation_get(ad->win));
}

} // namespace
} // namespace pelliko
