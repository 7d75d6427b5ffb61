#pragma once

#include <WApp.h>

namespace pelliko
{

/// The application object that the platform's frame drives. It has no data of its own: everything
/// is in the record of getAppData().
class PellikoApp : public app_assist::WApp
{
public:
    PellikoApp() = default;
    ~PellikoApp() override = default;

protected:
    bool onCreate() override;
    void onTerminate() override;
    void onPause() override;
    void onResume() override;
    void onAppControl(app_control_h request, bool firstLaunch) override;
};

} // namespace pelliko
