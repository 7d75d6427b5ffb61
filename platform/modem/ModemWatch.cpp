#include "ModemWatch.h"

#include "AccountSim.h"
#include "Modems.h"

#include <gio/gio.h>
#include <vector>

namespace pelliko::modem
{

struct ModemWatch::Impl : std::enable_shared_from_this<Impl> {
    std::function<void(const ModemList &)> changed;
    std::vector<std::unique_ptr<ModemService>> services = knownServices();
    std::vector<guint> names;
    GFileMonitor *account = nullptr;
    bool asking = false;
    bool askAgain = false;

    ~Impl();
    void begin();
    void ask();
    void answered(const ModemList &list);
};

namespace
{

void askInThread(GTask *task, gpointer, gpointer, GCancellable *)
{
    g_task_return_pointer(task, new ModemList(currentModems()),
                          [](gpointer list) { delete static_cast<ModemList *>(list); });
}

} // namespace

ModemWatch::Impl::~Impl()
{
    for (const guint name : names)
        g_bus_unwatch_name(name);
    if (!account)
        return;
    g_signal_handlers_disconnect_by_data(account, this);
    g_object_unref(account);
}

void ModemWatch::Impl::begin()
{
    for (const auto &service : services) {
        service->listen([this] { ask(); });
        const auto appeared = [](GDBusConnection *, const gchar *, const gchar *, gpointer self) {
            static_cast<Impl *>(self)->ask();
        };
        const auto vanished = [](GDBusConnection *, const gchar *, gpointer self) {
            static_cast<Impl *>(self)->ask();
        };
        names.push_back(g_bus_watch_name(G_BUS_TYPE_SYSTEM, service->busName(),
                                         G_BUS_NAME_WATCHER_FLAGS_AUTO_START, appeared, vanished,
                                         this, nullptr));
    }
    GFile *file = g_file_new_for_path(accountFile().c_str());
    account = g_file_monitor_file(file, G_FILE_MONITOR_WATCH_MOVES, nullptr, nullptr);
    g_object_unref(file);
    if (account)
        g_signal_connect_swapped(
            account, "changed",
            G_CALLBACK(+[](gpointer self) { static_cast<Impl *>(self)->ask(); }), this);
}

void ModemWatch::Impl::ask()
{
    askAgain = asking;
    if (asking)
        return;
    asking = true;
    const auto done = [](GObject *, GAsyncResult *result, gpointer waiting) {
        const std::unique_ptr<std::weak_ptr<Impl>> self(
            static_cast<std::weak_ptr<Impl> *>(waiting));
        const std::unique_ptr<ModemList> list(
            static_cast<ModemList *>(g_task_propagate_pointer(G_TASK(result), nullptr)));
        if (const auto impl = self->lock(); impl && list)
            impl->answered(*list);
    };
    GTask *task = g_task_new(nullptr, nullptr, done, new std::weak_ptr<Impl>(weak_from_this()));
    g_task_run_in_thread(task, askInThread);
    g_object_unref(task);
}

void ModemWatch::Impl::answered(const ModemList &list)
{
    asking = false;
    if (askAgain)
        ask();
    else
        changed(list);
}

ModemWatch::ModemWatch(std::function<void(const ModemList &)> changed)
    : impl_(std::make_shared<Impl>())
{
    impl_->changed = std::move(changed);
    impl_->begin();
}

ModemWatch::~ModemWatch() = default;

} // namespace pelliko::modem
