#include "Service.h"

#include "AccountWatch.h"
#include "AppLauncher.h"
#include "JoinedBook.h"
#include "PushChannel.h"
#include "PushDelivery.h"
#include "ServiceObject.h"
#include "SharesObject.h"
#include "StoreMarks.h"
#include "TransferThread.h"

#include <gio/gio.h>
#include <glib-unix.h>

#include <csignal>

namespace pelliko::service
{
namespace
{
constexpr int64_t historySeconds = 30LL * 24 * 3600;
constexpr const char *busName = "com.velmora.pelliko.Service";

// The parts that need the queue; made when it is loaded.
class Engine : public Orphans
{
public:
    Engine(const Settings &settings, GDBusConnection *bus, ServiceObject &object,
           SharesObject &shares, std::unique_ptr<UploadQueue> queue)
        : shares_(shares), queue_(std::move(queue)), journal_(*queue_),
          http_({settings.sendRate, settings.stallSeconds}), gate_([this] { networkChanged(); }),
          launcher_(bus, [this] { resume_.applicationGone(); }),
          context_{*queue_,
                   http_,
                   timers_,
                   gate_,
                   launcher_,
                   settings,
                   [&settings] { return usableAccount(settings.accountFile); },
                   randomFraction},
          uploads_(
              context_,
              [&object](const std::string &listener, int32_t id, const RequestReport &report) {
                  object.emit(listener, id, report);
              },
              [this] { resume_.lookSoon(); }, [this] { shares_.changed(); }),
          resume_(context_, *this), received_(context_, journal_, [this] { shares_.changed(); }),
          downloads_(context_, received_,
                     [this](const DownloadKey &key, const DownloadProgress &progress) {
                         shares_.emitProgress(key, progress);
                     }),
          delivery_(context_, journal_, [this] { shares_.changed(); }),
          push_(context_, journal_, [this] { delivery_.kick(); }),
          contacts_([this] { book_.lookSoon(); }), book_(context_, *queue_, contacts_),
          account_(settings.accountFile, [this] { accountChanged(); })
    {
        uploads_.load();
        journal_.dropBefore(timers_.epochSeconds() - historySeconds);
        object.open(context_, uploads_, resume_);
        shares_.open({context_, uploads_, received_, downloads_});
        resume_.lookAfter(settings.graceMs);
        accountChanged();
    }

    Engine(const Engine &) = delete;
    Engine &operator=(const Engine &) = delete;

    ~Engine() override { shares_.close(); }

    std::vector<int32_t> orphans() const override { return uploads_.orphans(); }
    bool isOrphan(int32_t id) const override { return uploads_.isOrphan(id); }
    void abandon(int32_t id) override { uploads_.abandon(id); }

private:
    void networkChanged()
    {
        uploads_.networkChanged();
        push_.networkChanged();
        book_.networkChanged();
        goOn();
    }

    void accountChanged()
    {
        push_.accountChanged();
        book_.lookSoon();
        goOn();
    }

    void goOn()
    {
        delivery_.kick();
        received_.kick();
    }

    SharesObject &shares_;
    std::unique_ptr<UploadQueue> queue_;
    ReceivedJournal journal_;
    LoopTimers timers_;
    TransferThread http_;
    MonitorGate gate_;
    AppLauncher launcher_;
    RequestContext context_;
    Uploads uploads_;
    ResumeLauncher resume_;
    ReceivedShares received_;
    Downloads downloads_;
    PushDelivery delivery_;
    PushChannel push_;
    StoreMarks contacts_;
    JoinedBook book_;
    AccountWatch account_;
};

struct Run {
    const Settings &settings;
    GMainLoop *loop;
    GDBusConnection *bus;
    int status = 0;
    bool named = false;
    std::unique_ptr<ServiceObject> object;
    std::unique_ptr<SharesObject> shares;
    std::unique_ptr<Engine> engine;

    void stop(int result)
    {
        status = result;
        g_main_loop_quit(loop);
    }
};

void deleteQueue(gpointer queue)
{
    std::unique_ptr<UploadQueue>(static_cast<UploadQueue *>(queue));
}

// Opening may take long (recovery, another program's lock): calls are answered meanwhile.
void loadQueue(GTask *task, gpointer, gpointer run, GCancellable *)
{
    try {
        auto queue = std::make_unique<UploadQueue>(static_cast<Run *>(run)->settings.queueFile);
        g_task_return_pointer(task, queue.release(), deleteQueue);
    } catch (const std::exception &fault) {
        g_task_return_new_error(task, G_IO_ERROR, G_IO_ERROR_FAILED, "%s", fault.what());
    }
}

void onQueueLoaded(GObject *, GAsyncResult *result, gpointer data)
{
    Run &run = *static_cast<Run *>(data);
    g_autoptr(GError) error = nullptr;
    std::unique_ptr<UploadQueue> queue(
        static_cast<UploadQueue *>(g_task_propagate_pointer(G_TASK(result), &error)));
    if (!queue) {
        g_warning("the queue %s cannot be loaded: %s", run.settings.queueFile.c_str(),
                  error->message);
        run.stop(1);
        return;
    }
    try {
        run.engine = std::make_unique<Engine>(run.settings, run.bus, *run.object, *run.shares,
                                              std::move(queue));
    } catch (const std::exception &fault) {
        g_warning("the queue %s cannot be read: %s", run.settings.queueFile.c_str(), fault.what());
        run.stop(1);
    }
}

// Only the owner of the name touches the queue.
void onNameAcquired(GDBusConnection *, const char *, gpointer data)
{
    static_cast<Run *>(data)->named = true;
    GTask *task = g_task_new(nullptr, nullptr, onQueueLoaded, data);
    g_task_set_task_data(task, data, nullptr);
    g_task_run_in_thread(task, loadQueue);
    g_object_unref(task);
}

void onNameLost(GDBusConnection *, const char *, gpointer data)
{
    Run &run = *static_cast<Run *>(data);
    g_message("%s", run.named ? "the bus name is lost" : "another pelliko-service is running");
    run.stop(run.named ? 1 : 0);
}

gboolean onTerminate(gpointer data)
{
    static_cast<Run *>(data)->stop(0);
    return G_SOURCE_CONTINUE;
}
} // namespace

int runService(const Settings &settings)
{
    g_autoptr(GError) error = nullptr;
    g_autoptr(GDBusConnection) bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, &error);
    if (!bus) {
        g_warning("no session bus: %s", error->message);
        return 1;
    }
    g_autoptr(GMainLoop) loop = g_main_loop_new(nullptr, FALSE);
    Run run{settings, loop, bus, 0, false, nullptr, nullptr, nullptr};
    const guint term = g_unix_signal_add(SIGTERM, onTerminate, &run);
    const guint interrupt = g_unix_signal_add(SIGINT, onTerminate, &run);
    run.object = std::make_unique<ServiceObject>(bus);
    run.shares = std::make_unique<SharesObject>(bus);
    const guint name =
        g_bus_own_name_on_connection(bus, busName, G_BUS_NAME_OWNER_FLAGS_DO_NOT_QUEUE,
                                     onNameAcquired, onNameLost, &run, nullptr);
    g_main_loop_run(loop);
    g_bus_unown_name(name);
    g_source_remove(term);
    g_source_remove(interrupt);
    run.object.reset();
    run.engine.reset();
    run.shares.reset();
    // Who still waited was answered just now.
    g_dbus_connection_flush_sync(bus, nullptr, nullptr);
    return run.status;
}

} // namespace pelliko::service
