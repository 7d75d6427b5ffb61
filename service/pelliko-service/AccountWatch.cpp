#include "AccountWatch.h"

#include <utility>

namespace pelliko::service
{
namespace
{
bool isNamed(GFile *file, const std::string &name)
{
    g_autofree char *base = file ? g_file_get_basename(file) : nullptr;
    return base && name == base;
}
} // namespace

// The folder is watched, for the file is replaced whole; it is made, for a missing one can only be
// looked for again and again.
AccountWatch::AccountWatch(const std::string &file, std::function<void()> changed)
    : changed_(std::move(changed))
{
    g_autofree char *folder = g_path_get_dirname(file.c_str());
    g_autofree char *name = g_path_get_basename(file.c_str());
    name_ = name;
    if (g_mkdir_with_parents(folder, 0700) != 0) {
        g_warning("the account's folder %s cannot be made", folder);
    }
    g_autoptr(GFile) watched = g_file_new_for_path(folder);
    g_autoptr(GError) error = nullptr;
    monitor_ = g_file_monitor_directory(watched, G_FILE_MONITOR_WATCH_MOVES, nullptr, &error);
    if (!monitor_) {
        g_warning("changes of the account are not noticed: %s", error->message);
        return;
    }
    g_signal_connect(monitor_, "changed", G_CALLBACK(onChange), this);
}

AccountWatch::~AccountWatch()
{
    if (monitor_) {
        g_signal_handlers_disconnect_by_data(monitor_, this);
        g_object_unref(monitor_);
    }
}

void AccountWatch::onChange(GFileMonitor *, GFile *file, GFile *other, GFileMonitorEvent,
                            gpointer self)
{
    const auto &watch = *static_cast<AccountWatch *>(self);
    if (isNamed(file, watch.name_) || isNamed(other, watch.name_)) {
        watch.changed_();
    }
}

} // namespace pelliko::service
