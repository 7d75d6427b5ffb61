// The application object that a program derives from.
#pragma once

#include "app_control.h"

namespace app_assist
{

class WWindowController;

/// The whole application: start() runs it, the virtual functions are its events. All of them are
/// called on the main loop's thread.
class WApp
{
public:
    WApp();
    virtual ~WApp();

    /// Runs the application to its end; the result is main's result (0 after a normal end).
    int start(int argc, char **argv);

    /// Takes ownership and creates the window at once: the window function, then the base-layout
    /// function. False (and the controller deleted) when it made no window.
    bool attachWindowController(WWindowController *controller);

    /// The attached controller of that name, or null. It stays the application's.
    WWindowController *getWindowController(const char *name);

protected:
    /// Initialises Elementary and enters the platform's main routine; its result is start()'s.
    virtual int onStart(int argc, char **argv);
    /// Once, before the first request. False ends the process without running the loop.
    virtual bool onCreate();
    /// Once, after the loop ended.
    virtual void onTerminate();
    /// The last visible window of the application was hidden; the first one became visible.
    virtual void onPause();
    virtual void onResume();
    /// A launch request, in arrival order. `request` is the frame's and valid during the call;
    /// clone it for later use. A start without any request brings one with the default operation.
    virtual void onAppControl(app_control_h request, bool firstLaunch);

private:
    WApp(const WApp &);
    WApp &operator=(const WApp &);
    struct Impl;
    Impl *impl_;
};

} // namespace app_assist
