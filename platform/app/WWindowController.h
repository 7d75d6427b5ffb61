// Creates one window of an application, when it is attached to it.
#pragma once

#include <Elementary.h>

#include <functional>

namespace app_assist
{

/// The window type for popups over whatever is on screen. Handsets count it as 12, EFL on a desktop
/// as 11, where 12 is another type.
constexpr Elm_Win_Type NOTIFICATION_WINDOW_TYPE = ELM_WIN_NOTIFICATION;

class WWindowController
{
public:
    typedef std::function<Evas_Object *(const char *name, Elm_Win_Type type)> CreateWindowFn;
    /// Writes the layout (may be NULL) to *layout; returns the object that becomes the base (the
    /// window itself when there is no layout).
    typedef std::function<Evas_Object *(Evas_Object *win, Evas_Object **layout)> CreateBaseLayoutFn;

    /// `name` is copied. The handset's number of the notification type (12) is taken as
    /// NOTIFICATION_WINDOW_TYPE.
    WWindowController(const char *name, Elm_Win_Type type);
    virtual ~WWindowController();

    void setCreateWindowFn(const CreateWindowFn &fn);
    void setCreateBaseLayoutFn(const CreateBaseLayoutFn &fn);

    const char *getName() const;
    Elm_Win_Type getWindowType() const;
    /// NULL until attached and again after the window was deleted. The controller does not own it.
    Evas_Object *getWindow() const;
    /// May be NULL.
    Evas_Object *getBaseLayout() const;

private:
    friend class WApp;
    WWindowController(const WWindowController &);
    WWindowController &operator=(const WWindowController &);
    struct Impl;
    Impl *impl_;
};

} // namespace app_assist
