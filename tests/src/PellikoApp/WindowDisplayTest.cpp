#include "PellikoApp/Window.h"

#include "PellikoUploadManager/ExitPolicy.h"
#include "support/PopupScene.h"

#include <Ecore_X.h>
#include <efl_util.h>
#include <filesystem>
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

TEST_F(Window, TablesThatAreNotThereAreOnlyMissed)
{
    const std::string tables = "/opt/usr/apps/com.velmora.pelliko/shared/res/tables";
    std::filesystem::rename(tables, tables + ".away");
    log.restart();
    _changeableGuiInit(app.get(), ad);
    std::filesystem::rename(tables + ".away", tables);
    EXPECT_THAT(log.messages(), ::testing::ElementsAre("uxt_theme_set_font_table() is failed."));
    EXPECT_EQ(ad->color_table, nullptr);
    EXPECT_EQ(ad->font_table, nullptr);
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

// Stands in for a window manager that turns windows: it says so at the root window.
TEST_F(Window, RotationIsFollowedWhereTheWindowManagerTurnsWindows)
{
    const Ecore_X_Window root = ecore_x_window_root_get(elm_win_xwindow_get(ad->win));
    evas_object_del(ad->win);
    Ecore_X_Window sign = ecore_x_window_new(root, 0, 0, 1, 1);
    for (const Ecore_X_Window at : {root, sign})
        ecore_x_window_prop_window_set(at, ECORE_X_ATOM_E_WINDOW_ROTATION_SUPPORTED, &sign, 1);
    ecore_x_sync();
    log.restart();
    ensureMainWindow(app.get(), ad);
    ecore_x_window_free(sign);
    EXPECT_THAT(log.messages(), ::testing::Contains("current rotation 0"));
    int *rotations = nullptr;
    unsigned int count = 0;
    ASSERT_TRUE(elm_win_wm_rotation_available_rotations_get(ad->win, &rotations, &count));
    EXPECT_THAT(std::vector(rotations, rotations + count), ::testing::ElementsAre(0, 90, 180, 270));
    free(rotations);
    elm_win_rotation_set(ad->win, 90);
    evas_object_smart_callback_call(ad->win, "wm,rotation,changed", nullptr);
    EXPECT_EQ(ad->rotation, 90);
    ad->rotation = 0;
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
