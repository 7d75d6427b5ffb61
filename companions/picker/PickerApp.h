// The picker program.
#pragma once

#include "PickWindow.h"

#include <OpenWindows.h>
#include <WApp.h>

namespace pelliko::picker
{

/// Opens a window for each launch request that lacks its recipients. Ends with the last one.
class PickerApp : public app_assist::WApp
{
protected:
    int onStart(int argc, char **argv) override;
    bool onCreate() override;
    void onTerminate() override;
    void onAppControl(app_control_h request, bool firstLaunch) override;

private:
    static void onLanguage(void *app);

    companion::OpenWindows<PickWindow> windows_;
};

} // namespace pelliko::picker
