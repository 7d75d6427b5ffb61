// The viewer program.
#pragma once

#include "ShareWindow.h"

#include <WApp.h>

#include <memory>
#include <vector>

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
    void closeLater(const std::string &token);
    static void onClose(void *app);
    static void onLanguage(void *app);
    static void onChanged(void *app);

    std::vector<std::unique_ptr<ShareWindow>> windows_;
    std::vector<std::string> closing_;
    Ecore_Job *job_ = nullptr;
};

} // namespace pelliko::viewer
