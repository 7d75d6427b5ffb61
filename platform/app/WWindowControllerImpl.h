// What the application object and its window controllers share.
#pragma once

#include "WWindowController.h"

#include <string>

struct app_assist::WWindowController::Impl {
    std::string name;
    Elm_Win_Type type;
    CreateWindowFn createWindow;
    CreateBaseLayoutFn createBaseLayout;
    Evas_Object *window = nullptr;
    Evas_Object *base = nullptr;
    Evas_Object *layout = nullptr;
    /// Called when the window is shown, hidden or deleted.
    std::function<void()> visibilityChanged;

    /// Runs both functions. False when there is no window afterwards.
    bool create();
    void forget();
    bool visible() const;

    static void onShowOrHide(void *data, Evas *canvas, Evas_Object *object, void *event);
    static void onDeleted(void *data, Evas *canvas, Evas_Object *object, void *event);
    static void onLayoutDeleted(void *data, Evas *canvas, Evas_Object *object, void *event);
};
