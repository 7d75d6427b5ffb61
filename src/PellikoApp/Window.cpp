#include "PellikoApp/Window.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/AppData.h"
#include "PellikoApp/CText.h"
#include "PellikoApp/ThemeLayout.h"

#include <Ecore_X.h>
#include <Elementary.h>
#include <WApp.h>
#include <WWindowController.h>
#include <app_common.h>
#include <efl_util.h>
#include <iterator>
#include <string>
#include <uxt_theme.h>

namespace pelliko
{

namespace
{

// Notification windows lie over all others. The handset's number of that type; the host's window
// controller maps it to its own.
constexpr auto notificationWindowType = static_cast<Elm_Win_Type>(12);
constexpr auto transparentIndicator = static_cast<Elm_Win_Indicator_Opacity_Mode>(3);
constexpr const char *windowClass = "APP_POPUP";
constexpr const char *colorTable = "tables/com.velmora.pelliko_ChangeableColorTable.xml";
constexpr const char *fontTable = "tables/com.velmora.pelliko_FontInfoTable.xml";

void _nameWindow(const Evas_Object *win)
{
    const Ecore_X_Window xwindow = elm_win_xwindow_get(win);
    if (xwindow)
        ecore_x_icccm_name_class_set(xwindow, windowClass, windowClass);
}

// A window that was shown for a request which then opened no popup is nothing but air over the
// whole screen, and would catch what is meant for the windows under it.
bool carriesPopup = false;

void _hideEmptyWindow(void *data)
{
    auto *ad = static_cast<PellikoAppData *>(data);
    if (ad->win && !carriesPopup)
        evas_object_hide(ad->win);
}

// The request is dispatched by the time the loop comes to its jobs.
void _awaitPopup(PellikoAppData *ad)
{
    carriesPopup = false;
    ecore_job_add(_hideEmptyWindow, ad);
}

Evas_Object *_createWindow(const char *name, Elm_Win_Type type)
{
    Evas_Object *win = elm_win_add(nullptr, name, type);
    if (!win)
        return nullptr;
    elm_win_alpha_set(win, EINA_TRUE);
    const int error =
        efl_util_set_notification_window_level(win, EFL_UTIL_NOTIFICATION_LEVEL_DEFAULT);
    if (error != EFL_UTIL_ERROR_NONE)
        LOG_ERROR("\033[0;31m* Critical * efl_util_set_notification_window_level() failed! : "
                  "%d\033[0;m",
                  error);
    elm_win_title_set(win, name);
    elm_win_conformant_set(win, EINA_FALSE);
    elm_win_autodel_set(win, EINA_TRUE);
    _nameWindow(win);
    evas_object_show(win);
    return win;
}

Evas_Object *_createNoLayout(Evas_Object *win, Evas_Object **layout)
{
    *layout = nullptr;
    return win;
}

Evas_Object *_attachWindow(app_assist::WApp *app)
{
    auto *controller = new app_assist::WWindowController("pelliko", notificationWindowType);
    controller->setCreateWindowFn(_createWindow);
    controller->setCreateBaseLayoutFn(_createNoLayout);
    return app->attachWindowController(controller) ? controller->getWindow() : nullptr;
}

void _followRotation(PellikoAppData *ad)
{
    if (!elm_win_wm_rotation_supported_get(ad->win))
        return;
    constexpr int rotations[] = {0, 90, 180, 270};
    elm_win_wm_rotation_available_rotations_set(ad->win, rotations, std::size(rotations));
    ad->rotation = elm_win_rotation_get(ad->win);
    LOG_DEBUG("current rotation %d", ad->rotation);
    evas_object_smart_callback_add(ad->win, "wm,rotation,changed", _rotationChangedCb, ad);
}

} // namespace

void _createMainWindow(app_assist::WApp *app, PellikoAppData *ad)
{
    Evas_Object *win = _attachWindow(app);
    if (!win) {
        LOG_ERROR("the window could not be created");
        return;
    }
    keepWhileAlive(&ad->win, win);
    elm_win_indicator_opacity_set(ad->win, transparentIndicator);
    _changeableGuiInit(app, ad);
    _followRotation(ad);
    _awaitPopup(ad);
}

void ensureMainWindow(app_assist::WApp *app, PellikoAppData *ad)
{
    if (!ad->win) {
        _createMainWindow(app, ad);
        return;
    }
    if (evas_object_visible_get(ad->win))
        return;
    evas_object_show(ad->win);
    elm_win_raise(ad->win);
    _awaitPopup(ad);
}

void showMainWindow(PellikoAppData *ad)
{
    if (!ad->win)
        return;
    carriesPopup = true;
    evas_object_show(ad->win);
    elm_win_raise(ad->win);
    elm_win_activate(ad->win);
}

void _changeableGuiInit(app_assist::WApp *, PellikoAppData *ad)
{
    uxt_theme_set_changeable_ui_enabled(EINA_TRUE);
    const CText resources(app_get_shared_resource_path());
    if (!resources)
        return;
    releaseChangeableGui(ad);
    ad->color_table =
        uxt_theme_add_color_table((std::string(resources.get()) + colorTable).c_str());
    ad->font_table = uxt_theme_add_font_table((std::string(resources.get()) + fontTable).c_str());
    if (uxt_theme_set_color_table(ad->color_table))
        LOG_DEBUG("uxt_theme_set_color_table() is success.");
    if (!uxt_theme_set_font_table(ad->font_table))
        LOG_DEBUG("uxt_theme_set_font_table() is failed.");
}

void releaseChangeableGui(PellikoAppData *ad)
{
    uxt_theme_release_color_table(ad->color_table);
    ad->color_table = nullptr;
    uxt_theme_release_font_table(ad->font_table);
    ad->font_table = nullptr;
}

void _rotationChangedCb(void *data, Evas_Object *win, void *)
{
    auto *ad = static_cast<PellikoAppData *>(data);
    RETURN_IF_NULL(ad, "data is NULL.");
    ad->rotation = elm_win_rotation_get(win);
}

} // namespace pelliko
