#pragma once

#include "Launcher.h"

#include <gio/gio.h>

namespace pelliko::service
{

/** Launches the application over the session bus, which starts it when it does not run. */
class AppLauncher : public Launcher
{
public:
    /** @param gone called from the main loop when the application has ended */
    AppLauncher(GDBusConnection *bus, std::function<void()> gone);
    ~AppLauncher() override;
    AppLauncher(const AppLauncher &) = delete;
    AppLauncher &operator=(const AppLauncher &) = delete;

    void launchSms(const SmsLaunch &launch, std::function<void(LaunchResult)> done) override;
    void launchPush(const std::vector<std::string> &tokens,
                    std::function<void(LaunchResult)> done) override;
    void launchResume(const std::vector<int32_t> &ids, std::function<void(bool)> done) override;

private:
    static void onAppeared(GDBusConnection *, const char *, const char *, gpointer self);
    static void onVanished(GDBusConnection *, const char *, gpointer self);

    GDBusConnection *bus_;
    std::function<void()> gone_;
    guint watch_;
    bool runs_ = false;
};

} // namespace pelliko::service
