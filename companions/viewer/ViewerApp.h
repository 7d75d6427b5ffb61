// The viewer program.
#pragma once

#include "ShareWindow.h"

#include <OpenWindows.h>
#include <WApp.h>

namespace pelliko::viewer
{

/// Opens a window for each received share that it is launched for. Ends with the last one.
class ViewerApp : public app_assist::WApp
{
protected:
    int onStart(int argc, char **argv) override;
    bool onCreate() override;
    void onTerminate() override;
    void onAppControl(app_control_h request, bool firstLaunch) override;

private:
    static void onLanguage(void *app);
    static void onChanged(void *app);

    companion::OpenWindows<ShareWindow> windows_;
};

} // namespace pelliko::viewer
