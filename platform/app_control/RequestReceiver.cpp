#include "RequestReceiver.h"

#include "ApplicationId.h"
#include "FilesReceiver.h"
#include "Handle.h"
#include "LaunchBus.h"
#include "Launcher.h"
#include "Serialisation.h"

#include <com.velmora.Platform.Application1.h>
#include <org.freedesktop.Application.h>

#include <deque>
#include <utility>

namespace pelliko::platform
{

namespace
{

constexpr guint32 kDoNotQueue = 4;
constexpr guint32 kPrimaryOwner = 1;
constexpr guint32 kAlreadyOwner = 4;

// One request on its way to the handler.
struct Arrival {
    RequestPtr request;
    // Told once: the handler has run, or the request goes back to its sender.
    std::function<void()> handled;
    std::function<void()> returned;
};

GVariant *noExtras()
{
    return g_variant_new("a{sv}", nullptr);
}

GVariant *answerOf(int result, GVariant *extras)
{
    return g_variant_new("(i@a{sv})", result, extras);
}

void returnLeaving(GDBusMethodInvocation *call)
{
    g_dbus_method_invocation_return_dbus_error(call, kLeavingError,
                                               "The application is ending; ask again.");
}

std::vector<std::string> localPaths(const char *const *uris)
{
    std::vector<std::string> paths;
    for (; uris && *uris; ++uris) {
        g_autoptr(GFile) file = g_file_new_for_uri(*uris);
        g_autofree char *path = g_file_get_path(file);
        if (path)
            paths.emplace_back(path);
    }
    return paths;
}

} // namespace

struct RequestReceiver::Impl {
    explicit Impl(std::string id) : applicationId(std::move(id)) {}

    bool exportObjects(GDBusConnection *bus, GError **error);
    void unexport();
    void prepare(Arrival &arrival);
    void push(Arrival arrival);
    void schedule();
    void giveBack();
    // A call of a desktop, which knows nothing of asking again: the request is sent anew for it.
    void pushForDesktop(app_control_h request);
    void sendAnew(app_control_h request) const;
    void passOn(RequestPtr request, GDBusMethodInvocation *call);

    static gboolean onLaunch(PelliPlatformApplication1 *object, GDBusMethodInvocation *call,
                             GVariant *contents, gboolean replyWanted, gpointer data);
    static gboolean onActivate(PelliFreedesktopApplication *object, GDBusMethodInvocation *call,
                               GVariant *platformData, gpointer data);
    static gboolean onOpen(PelliFreedesktopApplication *object, GDBusMethodInvocation *call,
                           const char *const *uris, GVariant *platformData, gpointer data);
    static gboolean onAction(PelliFreedesktopApplication *object, GDBusMethodInvocation *call,
                             const char *name, GVariant *parameter, GVariant *platformData,
                             gpointer data);
    static gboolean onTurn(gpointer data);
    static void onEarlierMessagesSeen(GObject *source, GAsyncResult *result, gpointer data);

    std::string applicationId;
    PelliPlatformApplication1 *launcher = nullptr;
    PelliFreedesktopApplication *desktop = nullptr;
    GCancellable *probe = nullptr;
    bool owned = false;
    bool closed = false;
    bool delivering = false;
    guint scheduled = 0;
    bool anyArrived = false;
    // How many are on their way to another application, also when this object has gone.
    std::shared_ptr<int> passing = std::make_shared<int>(0);
    bool anyPassedOn = false;
    RequestPtr start;
    Handler handler;
    std::deque<Arrival> waiting;
};

RequestReceiver::RequestReceiver(std::string applicationId)
    : impl_(std::make_unique<Impl>(std::move(applicationId)))
{
}

RequestReceiver::~RequestReceiver()
{
    close();
}

bool RequestReceiver::Impl::exportObjects(GDBusConnection *bus, GError **error)
{
    launcher = pelli_platform_application1_skeleton_new();
    desktop = pelli_freedesktop_application_skeleton_new();
    g_signal_connect(launcher, "handle-launch", G_CALLBACK(onLaunch), this);
    g_signal_connect(desktop, "handle-activate", G_CALLBACK(onActivate), this);
    g_signal_connect(desktop, "handle-open", G_CALLBACK(onOpen), this);
    g_signal_connect(desktop, "handle-activate-action", G_CALLBACK(onAction), this);
    const std::string path = applicationObjectPath(applicationId);
    return g_dbus_interface_skeleton_export(G_DBUS_INTERFACE_SKELETON(launcher), bus, path.c_str(),
                                            error) &&
           g_dbus_interface_skeleton_export(G_DBUS_INTERFACE_SKELETON(desktop), bus, path.c_str(),
                                            error);
}

void RequestReceiver::Impl::unexport()
{
    for (gpointer object : {static_cast<gpointer>(launcher), static_cast<gpointer>(desktop)}) {
        if (!object)
            continue;
        g_signal_handlers_disconnect_by_data(object, this);
        g_dbus_interface_skeleton_unexport(G_DBUS_INTERFACE_SKELETON(object));
        g_object_unref(object);
    }
    launcher = nullptr;
    desktop = nullptr;
}

RequestReceiver::Claim RequestReceiver::claim(std::string *error)
{
    g_autoptr(GError) failure = nullptr;
    GDBusConnection *bus = sessionBus(&failure);
    // The objects come before the name: a request may be waiting for the name to appear.
    if (!bus || !impl_->exportObjects(bus, &failure)) {
        *error = failure->message;
        return Claim::NoBus;
    }
    g_autoptr(GVariant) reply =
        callBus("RequestName", g_variant_new("(su)", impl_->applicationId.c_str(), kDoNotQueue),
                "(u)", &failure);
    guint32 answer = 0;
    if (reply)
        g_variant_get(reply, "(u)", &answer);
    impl_->owned = answer == kPrimaryOwner || answer == kAlreadyOwner;
    if (impl_->owned)
        return Claim::Owned;
    impl_->unexport();
    if (reply)
        return Claim::TakenByAnother;
    *error = failure->message;
    return Claim::NoBus;
}

void RequestReceiver::deliver(Handler handler, app_control_h start, bool always)
{
    impl_->handler = std::move(handler);
    impl_->start.reset(start);
    if (always) {
        impl_->waiting.push_front({std::move(impl_->start), nullptr, nullptr});
        impl_->prepare(impl_->waiting.front());
    }
    // Messages that waited for the name were sent before the answer to this question, so they have
    // arrived when it does. It also brings the first delivery into the running loop.
    impl_->probe = g_cancellable_new();
    g_dbus_connection_call(sessionBus(nullptr), "org.freedesktop.DBus", "/org/freedesktop/DBus",
                           "org.freedesktop.DBus", "GetId", nullptr, nullptr,
                           G_DBUS_CALL_FLAGS_NONE, -1, impl_->probe, Impl::onEarlierMessagesSeen,
                           impl_.get());
}

void RequestReceiver::Impl::onEarlierMessagesSeen(GObject *source, GAsyncResult *result,
                                                  gpointer data)
{
    g_autoptr(GError) error = nullptr;
    g_autoptr(GVariant) reply =
        g_dbus_connection_call_finish(G_DBUS_CONNECTION(source), result, &error);
    if (g_error_matches(error, G_IO_ERROR, G_IO_ERROR_CANCELLED))
        return;
    auto *self = static_cast<Impl *>(data);
    g_clear_object(&self->probe);
    if (!self->anyArrived)
        self->push({std::move(self->start), nullptr, nullptr});
    else
        self->schedule();
}

void RequestReceiver::Impl::prepare(Arrival &arrival)
{
    if (!arrival.request->operation)
        arrival.request->operation = APP_CONTROL_OPERATION_DEFAULT;
    if (!arrival.request->token)
        arrival.request->token = std::make_shared<ReplyToken>(
            [](int, GVariant *extras) { g_variant_unref(g_variant_ref_sink(extras)); });
    anyArrived = true;
}

void RequestReceiver::Impl::push(Arrival arrival)
{
    prepare(arrival);
    waiting.push_back(std::move(arrival));
    schedule();
}

// One request per turn of the loop: when one of them ends the loop, those behind it are given back
// to their senders instead of being handed to an application that is leaving.
void RequestReceiver::Impl::schedule()
{
    if (scheduled || delivering || closed || !handler || waiting.empty())
        return;
    scheduled = g_idle_add_full(G_PRIORITY_DEFAULT, onTurn, this, nullptr);
}

gboolean RequestReceiver::Impl::onTurn(gpointer data)
{
    auto *self = static_cast<Impl *>(data);
    self->scheduled = 0;
    self->delivering = true;
    const Arrival arrival = std::move(self->waiting.front());
    self->waiting.pop_front();
    self->handler(arrival.request.get());
    if (arrival.handled)
        arrival.handled();
    self->delivering = false;
    self->schedule();
    return G_SOURCE_REMOVE;
}

gboolean RequestReceiver::Impl::onLaunch(PelliPlatformApplication1 *, GDBusMethodInvocation *call,
                                         GVariant *contents, gboolean replyWanted, gpointer data)
{
    Arrival arrival;
    arrival.request.reset(fromVariant(contents));
    if (replyWanted) {
        arrival.request->token = std::make_shared<ReplyToken>([call](int result, GVariant *extras) {
            g_dbus_method_invocation_return_value(call, answerOf(result, extras));
        });
    } else {
        arrival.handled = [call] {
            g_dbus_method_invocation_return_value(
                call, answerOf(APP_CONTROL_RESULT_SUCCEEDED, noExtras()));
        };
    }
    arrival.returned = [call] { returnLeaving(call); };
    static_cast<Impl *>(data)->push(std::move(arrival));
    return TRUE;
}

void RequestReceiver::Impl::pushForDesktop(app_control_h request)
{
    push({RequestPtr(request), nullptr, [this, request] { sendAnew(request); }});
}

gboolean RequestReceiver::Impl::onActivate(PelliFreedesktopApplication *object,
                                           GDBusMethodInvocation *call, GVariant *, gpointer data)
{
    static_cast<Impl *>(data)->pushForDesktop(requestForFiles({}));
    pelli_freedesktop_application_complete_activate(object, call);
    return TRUE;
}

gboolean RequestReceiver::Impl::onOpen(PelliFreedesktopApplication *object,
                                       GDBusMethodInvocation *call, const char *const *uris,
                                       GVariant *, gpointer data)
{
    const std::vector<std::string> paths = localPaths(uris);
    if (paths.empty()) {
        g_dbus_method_invocation_return_error(call, G_DBUS_ERROR, G_DBUS_ERROR_INVALID_ARGS,
                                              "None of the addresses is a local file.");
        return TRUE;
    }
    auto *self = static_cast<Impl *>(data);
    RequestPtr request(requestForFiles(paths));
    if (std::string receiver = receiverOfFiles(self->applicationId);
        receiver != self->applicationId) {
        request->appId = std::move(receiver);
        self->passOn(std::move(request), call);
        return TRUE;
    }
    self->pushForDesktop(request.release());
    pelli_freedesktop_application_complete_open(object, call);
    return TRUE;
}

gboolean RequestReceiver::Impl::onAction(PelliFreedesktopApplication *object,
                                         GDBusMethodInvocation *call, const char *, GVariant *,
                                         GVariant *, gpointer)
{
    pelli_freedesktop_application_complete_activate_action(object, call);
    return TRUE;
}

void RequestReceiver::Impl::sendAnew(app_control_h request) const
{
    const std::string path = applicationObjectPath(applicationId);
    g_dbus_connection_call(sessionBus(nullptr), applicationId.c_str(), path.c_str(),
                           kLaunchInterface, "Launch",
                           g_variant_new("(@a{sv}b)", toVariant(request), FALSE), nullptr,
                           G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr, nullptr);
}

// Files that a desktop opens with this application are for whoever asks for the recipients; the
// desktop has its answer when that one has taken them.
void RequestReceiver::Impl::passOn(RequestPtr request, GDBusMethodInvocation *call)
{
    anyPassedOn = true;
    ++*passing;
    const auto settle = [call, count = passing](const std::string &error) {
        --*count;
        if (error.empty())
            g_dbus_method_invocation_return_value(call, nullptr);
        else
            g_dbus_method_invocation_return_error_literal(call, G_DBUS_ERROR, G_DBUS_ERROR_FAILED,
                                                          error.c_str());
    };
    const int code = launch(request.get(), false,
                            [settle](const LaunchOutcome &outcome) { settle(outcome.error); });
    if (code != APP_CONTROL_ERROR_NONE)
        settle(*request->appId + " cannot be started.");
}

bool RequestReceiver::onlyPassedOn()
{
    // Messages that waited for the name were sent before the answer to this question.
    g_autoptr(GVariant) answer = callBus("GetId", nullptr, nullptr, nullptr);
    while (g_main_context_iteration(nullptr, FALSE)) {
    }
    if (!impl_->anyPassedOn)
        return false;
    while (*impl_->passing > 0)
        g_main_context_iteration(nullptr, TRUE);
    return impl_->waiting.empty();
}

void RequestReceiver::Impl::giveBack()
{
    for (Arrival &arrival : waiting) {
        if (arrival.returned)
            arrival.returned();
        // The sender has its answer; the token must not give a second one.
        if (arrival.request->token)
            arrival.request->token->disarm();
    }
    waiting.clear();
}

void RequestReceiver::close()
{
    if (impl_->closed)
        return;
    impl_->closed = true;
    if (impl_->scheduled)
        g_source_remove(std::exchange(impl_->scheduled, 0U));
    if (impl_->probe)
        g_cancellable_cancel(impl_->probe);
    g_clear_object(&impl_->probe);
    if (!impl_->owned) {
        impl_->unexport();
        return;
    }
    g_autoptr(GVariant) released =
        callBus("ReleaseName", g_variant_new("(s)", impl_->applicationId.c_str()), "(u)", nullptr);
    // What came before the answer is on its way through the main context; one more look at that
    // brings it here.
    while (g_main_context_iteration(nullptr, FALSE)) {
    }
    impl_->giveBack();
    impl_->unexport();
    g_dbus_connection_flush_sync(sessionBus(nullptr), nullptr, nullptr);
}

} // namespace pelliko::platform
