#include "AppLauncher.h"

#include <memory>
#include <utility>

namespace pelliko::service
{
namespace
{
constexpr const char *applicationName = "com.velmora.pelliko";
constexpr const char *applicationPath = "/com/velmora/pelliko";
constexpr const char *launchInterface = "com.velmora.Platform.Application1";
constexpr const char *leavingError = "com.velmora.Platform.Error.Leaving";
constexpr const char *operationDefault = "http://tizen.org/appcontrol/operation/default";
constexpr const char *operationSend = "http://tizen.org/appcontrol/operation/send";
constexpr const char *operationSendText = "http://tizen.org/appcontrol/operation/send_text";

constexpr gint resultFailed = -1;

// Owns the reply or the error of one launch while it is looked at.
using Answered = std::function<void(GVariant *reply, const GError *error)>;

void onAnswered(GObject *source, GAsyncResult *result, gpointer data)
{
    const std::unique_ptr<Answered> answered(static_cast<Answered *>(data));
    g_autoptr(GError) error = nullptr;
    g_autoptr(GVariant) reply =
        g_dbus_connection_call_finish(G_DBUS_CONNECTION(source), result, &error);
    (*answered)(reply, error);
}

void launch(GDBusConnection *bus, const char *operation, GVariant *extras, bool replyWanted,
            Answered answered)
{
    GVariantBuilder request;
    g_variant_builder_init(&request, G_VARIANT_TYPE_VARDICT);
    g_variant_builder_add(&request, "{sv}", "operation", g_variant_new_string(operation));
    g_variant_builder_add(&request, "{sv}", "extras", extras);
    // However long the application takes; when it ends, the bus answers in its place.
    g_dbus_connection_call(bus, applicationName, applicationPath, launchInterface, "Launch",
                           g_variant_new("(a{sv}b)", &request, replyWanted ? TRUE : FALSE),
                           G_VARIANT_TYPE("(ia{sv})"), G_DBUS_CALL_FLAGS_NONE, G_MAXINT, nullptr,
                           onAnswered, new Answered(std::move(answered)));
}

void addText(GVariantBuilder &extras, const char *key, const std::string &value)
{
    g_autofree char *valid = g_utf8_make_valid(value.c_str(), -1);
    g_variant_builder_add(&extras, "{sv}", key, g_variant_new_string(valid));
}

void addTexts(GVariantBuilder &extras, const char *key, const std::vector<std::string> &values)
{
    GVariantBuilder list;
    g_variant_builder_init(&list, G_VARIANT_TYPE_STRING_ARRAY);
    for (const std::string &value : values) {
        g_autofree char *valid = g_utf8_make_valid(value.c_str(), -1);
        g_variant_builder_add(&list, "s", valid);
    }
    g_variant_builder_add(&extras, "{sv}", key, g_variant_builder_end(&list));
}

// Errors with which the bus, or the application's frame, says that nothing was handled.
bool surelyNotSent(const GError *error)
{
    g_autofree char *name = g_dbus_error_get_remote_error(error);
    if (g_strcmp0(name, leavingError) == 0) {
        return true;
    }
    const bool spawn = g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_SPAWN_EXEC_FAILED) ||
                       g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_SPAWN_CHILD_EXITED) ||
                       g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_SPAWN_CHILD_SIGNALED) ||
                       g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_SPAWN_FAILED) ||
                       g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_SPAWN_SERVICE_NOT_FOUND);
    return spawn || g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_SERVICE_UNKNOWN) ||
           g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_NAME_HAS_NO_OWNER) ||
           g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_UNKNOWN_METHOD) ||
           g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_UNKNOWN_OBJECT) ||
           g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_UNKNOWN_INTERFACE);
}

Answered receiptFor(std::function<void(LaunchResult)> done)
{
    return [done = std::move(done)](GVariant *reply, const GError *error) {
        if (reply) {
            done(LaunchResult::received);
            return;
        }
        g_message("the application did not confirm: %s", error->message);
        done(surelyNotSent(error) ? LaunchResult::notSent : LaunchResult::unknown);
    };
}

LaunchResult resultOf(GVariant *reply)
{
    gint result = -1;
    g_variant_get(reply, "(i@a{sv})", &result, nullptr);
    switch (result) {
    case 0:
        return LaunchResult::received;
    case resultFailed:
        return LaunchResult::notSent;
    default: // it ended, or let go of the request, without a word about the messages
        return LaunchResult::unknown;
    }
}

// The messages are settled when the application says so, which may be minutes after the launch.
Answered settlementFor(const std::function<void(LaunchResult)> &done)
{
    return [receipt = receiptFor(done), done](GVariant *reply, const GError *error) {
        if (reply) {
            done(resultOf(reply));
        } else {
            receipt(nullptr, error);
        }
    };
}

bool saysResumed(GVariant *reply)
{
    gint result = -1;
    g_autoptr(GVariant) extras = nullptr;
    g_variant_get(reply, "(i@a{sv})", &result, &extras);
    const char *resumed = nullptr;
    return result == 0 && g_variant_lookup(extras, "resume_by_app", "&s", &resumed) &&
           g_strcmp0(resumed, "1") == 0;
}
} // namespace

AppLauncher::AppLauncher(GDBusConnection *bus, std::function<void()> gone)
    : bus_(bus), gone_(std::move(gone)),
      watch_(g_bus_watch_name_on_connection(bus, applicationName, G_BUS_NAME_WATCHER_FLAGS_NONE,
                                            onAppeared, onVanished, this, nullptr))
{
}

AppLauncher::~AppLauncher()
{
    g_bus_unwatch_name(watch_);
}

void AppLauncher::onAppeared(GDBusConnection *, const char *, const char *, gpointer self)
{
    static_cast<AppLauncher *>(self)->runs_ = true;
}

void AppLauncher::onVanished(GDBusConnection *, const char *, gpointer self)
{
    auto &launcher = *static_cast<AppLauncher *>(self);
    if (std::exchange(launcher.runs_, false)) {
        launcher.gone_();
    }
}

void AppLauncher::launchSms(const SmsLaunch &data, std::function<void(LaunchResult)> done)
{
    GVariantBuilder extras;
    g_variant_builder_init(&extras, G_VARIANT_TYPE_VARDICT);
    addText(extras, "url", data.url);
    addText(extras, "from_msisdn", data.from);
    addText(extras, "expired_time", std::to_string(data.expires));
    addText(extras, "req_id", std::to_string(data.id));
    addText(extras, "sms_key", data.key);
    addText(extras, "file_count", std::to_string(data.fileCount));
    addTexts(extras, "to_msisdn", data.numbers);
    launch(bus_, operationSendText, g_variant_builder_end(&extras), true, settlementFor(done));
}

void AppLauncher::launchPush(const std::vector<std::string> &tokens,
                             std::function<void(LaunchResult)> done)
{
    GVariantBuilder extras;
    g_variant_builder_init(&extras, G_VARIANT_TYPE_VARDICT);
    addTexts(extras, "contents_token_list", tokens);
    launch(bus_, operationSend, g_variant_builder_end(&extras), false, receiptFor(std::move(done)));
}

void AppLauncher::launchResume(const std::vector<int32_t> &ids, std::function<void(bool)> done)
{
    std::vector<std::string> texts;
    texts.reserve(ids.size());
    for (const int32_t id : ids) {
        texts.push_back(std::to_string(id));
    }
    GVariantBuilder extras;
    g_variant_builder_init(&extras, G_VARIANT_TYPE_VARDICT);
    addTexts(extras, "upload_resume", texts);
    launch(bus_, operationDefault, g_variant_builder_end(&extras), true,
           [done = std::move(done)](GVariant *reply, const GError *error) {
               if (!reply) {
                   g_message("the application takes nothing over: %s", error->message);
               }
               done(reply && saysResumed(reply));
           });
}

} // namespace pelliko::service
