// The picker program.
#pragma once

#include "PickWindow.h"

#include <WApp.h>

#include <map>
#include <memory>
#include <vector>

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
    void closeLater(uint32_t key);
    static void onClose(void *app);
    static void onLanguage(void *app);

    std::map<uint32_t, std::unique_ptr<PickWindow>> windows_;
    uint32_t lastKey_ = 0;
    std::vector<uint32_t> closing_;
    Ecore_Job *job_ = nullptr;
};

} // namespace pelliko::picker
