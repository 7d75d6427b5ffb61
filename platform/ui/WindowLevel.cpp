#include "efl_util.h"

#include <Ecore_Evas.h>

#include <cstdint>

namespace
{

constexpr const char *levelKey = "efl_util_notification_level";

// Layers as the toolkit's X11 engine reads them: 6 asks for "above all", 4 for nothing.
constexpr int layerAbove = 6;
constexpr int layerNormal = 4;

bool isNotificationWindow(const Evas_Object *window)
{
    return elm_win_type_get(window) == ELM_WIN_NOTIFICATION;
}

bool isOnX11(const Evas_Object *window)
{
    return elm_win_xwindow_get(window) != 0;
}

// A desktop's window manager would give the window its own border, size and place.
void coverScreen(Evas_Object *window)
{
    elm_win_borderless_set(window, EINA_TRUE);
    if (!isOnX11(window)) {
        elm_win_fullscreen_set(window, EINA_TRUE);
        return;
    }
    int x = 0, y = 0, width = 0, height = 0;
    elm_win_screen_size_get(window, &x, &y, &width, &height);
    evas_object_move(window, x, y);
    evas_object_resize(window, width, height);
}

} // namespace

int efl_util_set_notification_window_level(Evas_Object *window, efl_util_notification_level_e level)
{
    if (!window)
        return EFL_UTIL_ERROR_INVALID_PARAMETER;
    if (!isNotificationWindow(window))
        return EFL_UTIL_ERROR_NOT_SUPPORTED_WINDOW_TYPE;
    evas_object_data_set(window, levelKey, reinterpret_cast<void *>(static_cast<intptr_t>(level)));
    const bool above = level != EFL_UTIL_NOTIFICATION_LEVEL_NONE;
    elm_win_layer_set(window, above ? layerAbove : layerNormal);
    if (above)
        coverScreen(window);
    return EFL_UTIL_ERROR_NONE;
}

int efl_util_get_notification_window_level(Evas_Object *window,
                                           efl_util_notification_level_e *level)
{
    if (!window || !level)
        return EFL_UTIL_ERROR_INVALID_PARAMETER;
    if (!isNotificationWindow(window))
        return EFL_UTIL_ERROR_NOT_SUPPORTED_WINDOW_TYPE;
    const auto stored = reinterpret_cast<intptr_t>(evas_object_data_get(window, levelKey));
    *level = stored ? static_cast<efl_util_notification_level_e>(stored)
                    : EFL_UTIL_NOTIFICATION_LEVEL_NONE;
    return EFL_UTIL_ERROR_NONE;
}
