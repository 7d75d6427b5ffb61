#include "Launcher.h"

#include "ApplicationId.h"
#include "Handle.h"
#include "LaunchBus.h"
#include "Serialisation.h"

#include <dlog.h>

namespace pelliko::platform
{

namespace
{

constexpr const char *kLogTag = "APP_CONTROL";
// An instance that is leaving gives a request back; a new one then takes it. More rounds than this
// mean an application that ends as fast as it starts.
constexpr int kMaxAttempts = 5;

struct PendingLaunch {
    RequestPtr request;
    bool replyWanted = false;
    LaunchCallback done;
    int attempts = 0;
    // The launcher refused after the call was under way: its answer is of no interest any more.
    bool refused = false;
};

RequestPtr copyToSend(app_control_h request)
{
    RequestPtr copy(new app_control_s(*request));
    // The right to answer stays with the received request.
    copy->token.reset();
    return copy;
}

GVariant *arguments(app_control_h request, bool replyWanted)
{
    g_autoptr(GVariant) contents = g_variant_ref_sink(toVariant(request));
    GVariantDict dictionary;
    g_variant_dict_init(&dictionary, contents);
    g_variant_dict_insert(&dictionary, "caller", "s", applicationId().c_str());
    return g_variant_new("(@a{sv}b)", g_variant_dict_end(&dictionary), replyWanted);
}

bool isError(const GError *error, const char *name)
{
    g_autofree char *remote = g_dbus_error_get_remote_error(error);
    return g_strcmp0(remote, name) == 0;
}

void finish(PendingLaunch &pending, GVariant *answer, const GError *error)
{
    RequestPtr reply(new app_control_s);
    LaunchOutcome outcome{pending.request.get(), reply.get(), APP_CONTROL_RESULT_CANCELED, {}};
    if (answer) {
        gint32 result = 0;
        g_autoptr(GVariant) extras = nullptr;
        g_variant_get(answer, "(i@a{sv})", &result, &extras);
        addExtrasFromVariant(reply.get(), extras);
        outcome.result = static_cast<app_control_result_e>(result);
    } else {
        outcome.error = error->message;
    }
    if (pending.done)
        pending.done(outcome);
}

void sendLaunch(std::unique_ptr<PendingLaunch> pending, GDBusConnection *bus);

void onAnswer(GObject *source, GAsyncResult *result, gpointer data)
{
    std::unique_ptr<PendingLaunch> pending(static_cast<PendingLaunch *>(data));
    g_autoptr(GError) error = nullptr;
    g_autoptr(GVariant) answer =
        g_dbus_connection_call_finish(G_DBUS_CONNECTION(source), result, &error);
    if (pending->refused)
        return;
    if (!answer && isError(error, kLeavingError) && pending->attempts < kMaxAttempts) {
        sendLaunch(std::move(pending), G_DBUS_CONNECTION(source));
        return;
    }
    finish(*pending, answer, error);
}

// The call itself starts an application that is not running.
void sendLaunch(std::unique_ptr<PendingLaunch> pending, GDBusConnection *bus)
{
    ++pending->attempts;
    app_control_h request = pending->request.get();
    const std::string path = applicationObjectPath(*request->appId);
    GVariant *body = arguments(request, pending->replyWanted);
    // No time limit: a person may take any time to answer a sign-in.
    g_dbus_connection_call(bus, request->appId->c_str(), path.c_str(), kLaunchInterface, "Launch",
                           body, G_VARIANT_TYPE("(ia{sv})"), G_DBUS_CALL_FLAGS_NONE, G_MAXINT,
                           nullptr, onAnswer, pending.release());
}

int codeOfStartError(const GError *error)
{
    // The bus reports a program that ended before it took its name in the same family as files that
    // are missing or unusable; only the latter mean that the application is not there.
    const bool startedButFailed =
        g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_SPAWN_CHILD_EXITED) ||
        g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_SPAWN_CHILD_SIGNALED);
    g_autofree char *remote = g_dbus_error_get_remote_error(error);
    if (startedButFailed)
        return APP_CONTROL_ERROR_LAUNCH_FAILED;
    if (isError(error, "org.freedesktop.DBus.Error.ServiceUnknown") ||
        (remote && g_str_has_prefix(remote, "org.freedesktop.DBus.Error.Spawn.")))
        return APP_CONTROL_ERROR_APP_NOT_FOUND;
    if (g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_ACCESS_DENIED))
        return APP_CONTROL_ERROR_PERMISSION_DENIED;
    const bool late = g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_TIMED_OUT) ||
                      g_error_matches(error, G_IO_ERROR, G_IO_ERROR_TIMED_OUT);
    return late ? APP_CONTROL_ERROR_TIMED_OUT : APP_CONTROL_ERROR_LAUNCH_FAILED;
}

// Joins the start that the call before it has caused, and so learns whether it worked.
int waitUntilStarted(const std::string &id)
{
    g_autoptr(GError) error = nullptr;
    g_autoptr(GVariant) reply =
        callBus("StartServiceByName", g_variant_new("(su)", id.c_str(), guint32{0}), "(u)", &error);
    if (reply)
        return APP_CONTROL_ERROR_NONE;
    dlog_print(DLOG_ERROR, kLogTag, "%s cannot be started: %s", id.c_str(), error->message);
    return codeOfStartError(error);
}

GVariant *callRunningInstance(app_control_h request, GError **error)
{
    GDBusConnection *bus = sessionBus(error);
    if (!bus)
        return nullptr;
    const std::string path = applicationObjectPath(*request->appId);
    return g_dbus_connection_call_sync(bus, request->appId->c_str(), path.c_str(), kLaunchInterface,
                                       "Launch", arguments(request, false),
                                       G_VARIANT_TYPE("(ia{sv})"), G_DBUS_CALL_FLAGS_NO_AUTO_START,
                                       -1, nullptr, error);
}

} // namespace

int launch(app_control_h request, bool replyWanted, LaunchCallback done)
{
    if (!request)
        return APP_CONTROL_ERROR_INVALID_PARAMETER;
    if (!request->appId || !isApplicationId(request->appId->c_str()))
        return APP_CONTROL_ERROR_APP_NOT_FOUND;
    g_autoptr(GError) error = nullptr;
    GDBusConnection *bus = sessionBus(&error);
    if (!bus) {
        dlog_print(DLOG_ERROR, kLogTag, "no session bus: %s", error->message);
        return APP_CONTROL_ERROR_IO_ERROR;
    }
    auto pending = std::make_unique<PendingLaunch>();
    pending->request = copyToSend(request);
    pending->replyWanted = replyWanted;
    pending->done = std::move(done);
    const std::string id = *request->appId;
    const bool running = nameHasOwner(id);
    PendingLaunch *underWay = pending.get();
    sendLaunch(std::move(pending), bus);
    if (running)
        return APP_CONTROL_ERROR_NONE;
    // Answers come from the main context, which does not turn during this call: still alive here.
    const int code = waitUntilStarted(id);
    underWay->refused = code != APP_CONTROL_ERROR_NONE;
    return code;
}

HandOver handOver(app_control_h request, std::string *error)
{
    g_autoptr(GError) failure = nullptr;
    g_autoptr(GVariant) answer = callRunningInstance(request, &failure);
    if (answer)
        return HandOver::Done;
    const bool gone = g_error_matches(failure, G_DBUS_ERROR, G_DBUS_ERROR_NAME_HAS_NO_OWNER) ||
                      g_error_matches(failure, G_DBUS_ERROR, G_DBUS_ERROR_SERVICE_UNKNOWN) ||
                      g_error_matches(failure, G_DBUS_ERROR, G_DBUS_ERROR_NO_REPLY) ||
                      isError(failure, kLeavingError);
    if (error)
        *error = failure->message;
    return gone ? HandOver::NobodyThere : HandOver::Failed;
}

} // namespace pelliko::platform
