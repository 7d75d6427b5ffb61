#include "Desktop.h"

#include <cstring>

namespace pelliko::quickpanel
{
namespace
{

constexpr const char *daemonName = "org.freedesktop.Notifications";
constexpr const char *daemonPath = "/org/freedesktop/Notifications";
constexpr guint32 dismissedByUser = 2;

struct ShowCall {
    Desktop::Shown done;
};

bool wasCancelled(const GError *error)
{
    return g_error_matches(error, G_IO_ERROR, G_IO_ERROR_CANCELLED);
}

std::string escape(const std::string &text)
{
    gchar *escaped = g_markup_escape_text(text.data(), static_cast<gssize>(text.size()));
    std::string result = escaped;
    g_free(escaped);
    return result;
}

GVariant *actionsOf(const Presentation &what)
{
    const gchar *const actions[] = {"default", "Open", nullptr};
    return g_variant_new_strv(actions, what.tappable ? 2 : 0);
}

} // namespace

Desktop::Desktop(GDBusConnection *bus, Listener listener)
    : bus_(bus), listener_(std::move(listener)), cancel_(g_cancellable_new())
{
    signals_ = g_dbus_connection_signal_subscribe(bus_, daemonName, daemonName, nullptr, daemonPath,
                                                  nullptr, G_DBUS_SIGNAL_FLAGS_NONE, onSignal, this,
                                                  nullptr);
    watch_ = g_bus_watch_name_on_connection(bus_, daemonName, G_BUS_NAME_WATCHER_FLAGS_NONE,
                                            onAppeared, onVanished, this, nullptr);
}

Desktop::~Desktop()
{
    g_bus_unwatch_name(watch_);
    g_dbus_connection_signal_unsubscribe(bus_, signals_);
    g_cancellable_cancel(cancel_);
    g_object_unref(cancel_);
}

void Desktop::show(const Presentation &what, uint32_t replaces, Shown done)
{
    Pending pending{what, replaces, std::move(done)};
    if (ready_) {
        send(pending);
        return;
    }
    pending_.push_back(std::move(pending));
    askCapabilities();
}

void Desktop::close(uint32_t number)
{
    g_dbus_connection_call(bus_, daemonName, daemonPath, daemonName, "CloseNotification",
                           g_variant_new("(u)", number), nullptr, G_DBUS_CALL_FLAGS_NO_AUTO_START,
                           -1, nullptr, nullptr, nullptr);
}

void Desktop::onAppeared(GDBusConnection *, const gchar *, const gchar *owner, gpointer self)
{
    auto *desktop = static_cast<Desktop *>(self);
    desktop->owner_ = owner;
    if (desktop->answered_)
        desktop->becomeReady();
    else
        desktop->askCapabilities();
}

void Desktop::onVanished(GDBusConnection *, const gchar *, gpointer self)
{
    auto *desktop = static_cast<Desktop *>(self);
    desktop->owner_.clear();
    desktop->ready_ = false;
    desktop->answered_ = false;
    desktop->listener_.vanished();
}

// Doubles as the question whether there is a daemon at all: the call starts one where it can be
// started.
void Desktop::askCapabilities()
{
    if (asking_)
        return;
    asking_ = true;
    g_dbus_connection_call(bus_, daemonName, daemonPath, daemonName, "GetCapabilities", nullptr,
                           G_VARIANT_TYPE("(as)"), G_DBUS_CALL_FLAGS_NONE, -1, cancel_,
                           onCapabilities, this);
}

void Desktop::onCapabilities(GObject *bus, GAsyncResult *result, gpointer self)
{
    GError *error = nullptr;
    const Variant reply =
        Variant::adopt(g_dbus_connection_call_finish(G_DBUS_CONNECTION(bus), result, &error));
    if (wasCancelled(error)) {
        g_error_free(error);
        return;
    }
    auto *desktop = static_cast<Desktop *>(self);
    desktop->asking_ = false;
    if (error) {
        desktop->askedInVain(error);
        g_error_free(error);
        return;
    }
    const gchar **capabilities = nullptr;
    g_variant_get(reply.get(), "(^a&s)", &capabilities);
    desktop->markup_ = g_strv_contains(capabilities, "body-markup");
    g_free(capabilities);
    desktop->answered_ = true;
    if (!desktop->owner_.empty())
        desktop->becomeReady();
}

// The next thing to show asks again.
void Desktop::askedInVain(const GError *error)
{
    g_printerr("quickpanel: nothing shows notifications: %s\n", error->message);
    for (const auto &pending : std::exchange(pending_, {}))
        pending.done(0);
}

void Desktop::becomeReady()
{
    ready_ = true;
    for (const auto &pending : std::exchange(pending_, {}))
        send(pending);
    listener_.appeared();
}

void Desktop::send(const Pending &pending)
{
    const Presentation &what = pending.what;
    const std::string body = markup_ ? escape(what.body) : what.body;
    g_dbus_connection_call(bus_, daemonName, daemonPath, daemonName, "Notify",
                           g_variant_new("(susss@as@a{sv}i)", what.application.c_str(),
                                         pending.replaces, what.icon.c_str(), what.summary.c_str(),
                                         body.c_str(), actionsOf(what), what.hints.get(),
                                         what.timeoutMs),
                           G_VARIANT_TYPE("(u)"), G_DBUS_CALL_FLAGS_NO_AUTO_START, -1, cancel_,
                           onShown, new ShowCall{pending.done});
}

void Desktop::onShown(GObject *bus, GAsyncResult *result, gpointer call)
{
    const std::unique_ptr<ShowCall> show(static_cast<ShowCall *>(call));
    GError *error = nullptr;
    const Variant reply =
        Variant::adopt(g_dbus_connection_call_finish(G_DBUS_CONNECTION(bus), result, &error));
    guint32 number = 0;
    if (reply)
        g_variant_get(reply.get(), "(u)", &number);
    const bool cancelled = wasCancelled(error);
    if (error && !cancelled)
        g_printerr("quickpanel: a notification was not shown: %s\n", error->message);
    g_clear_error(&error);
    if (!cancelled)
        show->done(number);
}

void Desktop::onSignal(GDBusConnection *, const gchar *, const gchar *, const gchar *,
                       const gchar *signal, GVariant *parameters, gpointer self)
{
    auto *desktop = static_cast<Desktop *>(self);
    guint32 number = 0;
    if (std::strcmp(signal, "ActionInvoked") == 0 &&
        g_variant_is_of_type(parameters, G_VARIANT_TYPE("(us)"))) {
        const gchar *action = nullptr;
        g_variant_get(parameters, "(u&s)", &number, &action);
        if (std::strcmp(action, "default") == 0)
            desktop->listener_.tapped(number);
    } else if (std::strcmp(signal, "NotificationClosed") == 0 &&
               g_variant_is_of_type(parameters, G_VARIANT_TYPE("(uu)"))) {
        guint32 reason = 0;
        g_variant_get(parameters, "(uu)", &number, &reason);
        desktop->listener_.closed(number, reason == dismissedByUser);
    }
}

} // namespace pelliko::quickpanel
