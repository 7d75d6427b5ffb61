#include "RecordingDaemon.h"

#include <cstring>
#include <stdexcept>

namespace panel_testing
{
namespace
{

constexpr const char *daemonName = "org.freedesktop.Notifications";
constexpr const char *daemonPath = "/org/freedesktop/Notifications";
constexpr guint32 closedByCall = 3;

constexpr const char *description = R"(<node><interface name="org.freedesktop.Notifications">
  <method name="GetCapabilities"><arg type="as" direction="out"/></method>
  <method name="Notify">
    <arg type="s" direction="in"/><arg type="u" direction="in"/><arg type="s" direction="in"/>
    <arg type="s" direction="in"/><arg type="s" direction="in"/><arg type="as" direction="in"/>
    <arg type="a{sv}" direction="in"/><arg type="i" direction="in"/>
    <arg type="u" direction="out"/>
  </method>
  <method name="CloseNotification"><arg type="u" direction="in"/></method>
</interface></node>)";

GVariant *arrayOf(const std::vector<std::string> &words)
{
    GVariantBuilder builder;
    g_variant_builder_init(&builder, G_VARIANT_TYPE("as"));
    for (const auto &word : words)
        g_variant_builder_add(&builder, "s", word.c_str());
    return g_variant_builder_end(&builder);
}

} // namespace

std::string Shown::hint(const char *name) const
{
    const Variant value = Variant::adopt(g_variant_lookup_value(hints.get(), name, nullptr));
    if (!value)
        return {};
    gchar *text = g_variant_print(value.get(), FALSE);
    std::string result = text;
    g_free(text);
    return result;
}

RecordingDaemon::RecordingDaemon(std::vector<std::string> capabilities)
    : interface_(g_dbus_node_info_new_for_xml(description, nullptr)),
      capabilities_(std::move(capabilities))
{
    static const GDBusInterfaceVTable functions = {onCall, nullptr, nullptr, {}};
    GError *error = nullptr;
    object_ =
        g_dbus_connection_register_object(connection_.get(), daemonPath, interface_->interfaces[0],
                                          &functions, this, nullptr, &error);
    if (object_ == 0)
        throw std::runtime_error(error->message);
    connection_.own(daemonName);
}

// A call that came but was not handled yet is dropped with the object.
RecordingDaemon::~RecordingDaemon()
{
    g_dbus_connection_unregister_object(connection_.get(), object_);
    g_dbus_node_info_unref(interface_);
}

bool RecordingDaemon::waitForCalls(size_t count)
{
    return waitUntil([&] { return calls_.size() >= count; });
}

bool RecordingDaemon::waitForVisible(size_t count)
{
    return waitUntil([&] { return visible_.size() == count; });
}

void RecordingDaemon::tap(uint32_t number)
{
    g_dbus_connection_emit_signal(connection_.get(), nullptr, daemonPath, daemonName,
                                  "ActionInvoked", g_variant_new("(us)", number, "default"),
                                  nullptr);
}

void RecordingDaemon::close(uint32_t number, uint32_t reason)
{
    visible_.erase(number);
    g_dbus_connection_emit_signal(connection_.get(), nullptr, daemonPath, daemonName,
                                  "NotificationClosed", g_variant_new("(uu)", number, reason),
                                  nullptr);
}

void RecordingDaemon::onCall(GDBusConnection *, const gchar *, const gchar *, const gchar *,
                             const gchar *method, GVariant *parameters, GDBusMethodInvocation *call,
                             gpointer self)
{
    auto *daemon = static_cast<RecordingDaemon *>(self);
    if (std::strcmp(method, "GetCapabilities") == 0) {
        g_dbus_method_invocation_return_value(
            call, g_variant_new("(@as)", arrayOf(daemon->capabilities_)));
    } else if (std::strcmp(method, "Notify") == 0) {
        g_dbus_method_invocation_return_value(call,
                                              g_variant_new("(u)", daemon->notify(parameters)));
    } else {
        guint32 number = 0;
        g_variant_get(parameters, "(u)", &number);
        g_dbus_method_invocation_return_value(call, nullptr);
        daemon->close(number, closedByCall);
    }
}

uint32_t RecordingDaemon::notify(GVariant *parameters)
{
    const gchar *application = nullptr, *icon = nullptr, *summary = nullptr, *body = nullptr;
    guint32 replaces = 0;
    const gchar **actions = nullptr;
    GVariant *hints = nullptr;
    gint32 timeout = 0;
    g_variant_get(parameters, "(&su&s&s&s^a&s@a{sv}i)", &application, &replaces, &icon, &summary,
                  &body, &actions, &hints, &timeout);
    const uint32_t number = replaces != 0 ? replaces : ++last_;
    Shown shown{number, replaces, application,           icon,   summary,
                body,   {},       Variant::adopt(hints), timeout};
    for (const gchar **action = actions; *action; ++action)
        shown.actions.emplace_back(*action);
    g_free(actions);
    calls_.push_back(std::move(shown));
    visible_.insert(number);
    return number;
}

} // namespace panel_testing
