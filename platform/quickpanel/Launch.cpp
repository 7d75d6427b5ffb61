#include "Launch.h"

#include <memory>
#include <string>

#include "ApplicationId.h"

namespace pelliko::quickpanel
{
namespace
{

using notification::Variant;

constexpr const char *leavingError = "com.velmora.Platform.Error.Leaving";
// An application that is ending gives the request back for its next instance.
constexpr int maxAttempts = 5;

struct Launching {
    Variant request;
    std::string app;
    int attempts = 0;
};

void send(GDBusConnection *bus, std::unique_ptr<Launching> launching);

bool isLeaving(const GError *error)
{
    gchar *name = g_dbus_error_get_remote_error(error);
    const bool leaving = g_strcmp0(name, leavingError) == 0;
    g_free(name);
    return leaving;
}

void onAnswer(GObject *bus, GAsyncResult *result, gpointer data)
{
    std::unique_ptr<Launching> launching(static_cast<Launching *>(data));
    GError *error = nullptr;
    const Variant answer =
        Variant::adopt(g_dbus_connection_call_finish(G_DBUS_CONNECTION(bus), result, &error));
    if (!error)
        return;
    if (isLeaving(error) && launching->attempts < maxAttempts)
        send(G_DBUS_CONNECTION(bus), std::move(launching));
    else
        g_printerr("quickpanel: a tap did not reach %s: %s\n", launching->app.c_str(),
                   error->message);
    g_error_free(error);
}

void send(GDBusConnection *bus, std::unique_ptr<Launching> launching)
{
    ++launching->attempts;
    const std::string app = launching->app;
    const std::string path = platform::applicationObjectPath(app);
    GVariant *arguments = g_variant_new("(@a{sv}b)", launching->request.get(), FALSE);
    g_dbus_connection_call(bus, app.c_str(), path.c_str(), "com.velmora.Platform.Application1",
                           "Launch", arguments, G_VARIANT_TYPE("(ia{sv})"), G_DBUS_CALL_FLAGS_NONE,
                           G_MAXINT, nullptr, onAnswer, launching.release());
}

} // namespace

void launch(GDBusConnection *bus, const notification::Record &record)
{
    if (!record.launch)
        return;
    const gchar *app = nullptr;
    if (!g_variant_lookup(record.launch.get(), "app_id", "&s", &app) || !g_dbus_is_name(app) ||
        g_dbus_is_unique_name(app)) {
        g_printerr("quickpanel: the launch request of a notification of %s names no application\n",
                   record.app.c_str());
        return;
    }
    GVariantDict request;
    g_variant_dict_init(&request, record.launch.get());
    g_variant_dict_insert(&request, "caller", "s", platform::applicationId().c_str());
    auto launching = std::make_unique<Launching>();
    launching->request = Variant(g_variant_dict_end(&request));
    launching->app = app;
    send(bus, std::move(launching));
}

} // namespace pelliko::quickpanel
