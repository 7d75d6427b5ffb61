// Notices changes of the account's file
#pragma once

#include <gio/gio.h>

#include <functional>
#include <string>

namespace pelliko::service
{

/** Notices when the account's file appears, changes or goes. Belongs to the main loop. */
class AccountWatch
{
public:
    AccountWatch(const std::string &file, std::function<void()> changed);
    ~AccountWatch();
    AccountWatch(const AccountWatch &) = delete;
    AccountWatch &operator=(const AccountWatch &) = delete;

private:
    static void onChange(GFileMonitor *, GFile *file, GFile *other, GFileMonitorEvent,
                         gpointer self);

    std::string name_;
    std::function<void()> changed_;
    GFileMonitor *monitor_ = nullptr;
};

} // namespace pelliko::service
