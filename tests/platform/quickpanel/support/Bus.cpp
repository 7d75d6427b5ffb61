#include "Bus.h"

#include <csignal>
#include <stdexcept>

#include "PanelClient.h"

namespace panel_testing
{
namespace
{

constexpr guint patienceMs = 20000;

gboolean onPatienceOver(gpointer over)
{
    *static_cast<bool *>(over) = true;
    return G_SOURCE_CONTINUE;
}

std::vector<Variant> itemsOf(const char *method, GVariant *parameters)
{
    const auto reply = pelliko::notification::callPanel(method, parameters, "(aa{sv})");
    if (reply.error != 0)
        throw std::runtime_error(std::string(method) + " failed");
    const Variant array = Variant::adopt(g_variant_get_child_value(reply.value.get(), 0));
    std::vector<Variant> items;
    for (gsize i = 0; i < g_variant_n_children(array.get()); ++i)
        items.push_back(Variant::adopt(g_variant_get_child_value(array.get(), i)));
    return items;
}

std::string word(const Variant &dictionary, const char *key)
{
    const gchar *value = "";
    g_variant_lookup(dictionary.get(), key, "&s", &value);
    return value;
}

void onVanished(GDBusConnection *, const gchar *, gpointer gone)
{
    *static_cast<bool *>(gone) = true;
}

} // namespace

bool waitUntil(const std::function<bool()> &condition)
{
    bool over = false;
    const guint timer = g_timeout_add(patienceMs, onPatienceOver, &over);
    bool holds = condition();
    while (!holds && !over) {
        g_main_context_iteration(nullptr, TRUE);
        holds = condition();
    }
    g_source_remove(timer);
    return holds;
}

Connection::Connection()
{
    GError *error = nullptr;
    gchar *address = g_dbus_address_get_for_bus_sync(G_BUS_TYPE_SESSION, nullptr, &error);
    bus_ =
        address
            ? g_dbus_connection_new_for_address_sync(
                  address,
                  static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                                    G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION),
                  nullptr, nullptr, &error)
            : nullptr;
    g_free(address);
    if (!bus_)
        throw std::runtime_error(error->message);
}

Connection::~Connection()
{
    g_dbus_connection_close_sync(bus_, nullptr, nullptr);
    g_object_unref(bus_);
}

Variant Connection::call(const char *name, const char *path, const char *interface,
                         const char *method, GVariant *parameters) const
{
    GError *error = nullptr;
    GVariant *reply =
        g_dbus_connection_call_sync(bus_, name, path, interface, method, parameters, nullptr,
                                    G_DBUS_CALL_FLAGS_NONE, -1, nullptr, &error);
    if (!reply)
        throw std::runtime_error(error->message);
    return Variant::adopt(reply);
}

void Connection::own(const char *name)
{
    const Variant reply =
        call("org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus", "RequestName",
             g_variant_new("(su)", name, 4));
    guint32 answer = 0;
    g_variant_get(reply.get(), "(u)", &answer);
    if (answer != 1)
        throw std::runtime_error(std::string(name) + " has an owner already");
}

void killOwner(const char *name)
{
    const Connection connection;
    guint32 pid = 0;
    try {
        const Variant reply =
            connection.call("org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
                            "GetConnectionUnixProcessID", g_variant_new("(s)", name));
        g_variant_get(reply.get(), "(u)", &pid);
    } catch (const std::runtime_error &) {
        return;
    }
    kill(static_cast<pid_t>(pid), SIGKILL);
    bool gone = false;
    const guint watch = g_bus_watch_name_on_connection(
        connection.get(), name, G_BUS_NAME_WATCHER_FLAGS_NONE, nullptr, onVanished, &gone, nullptr);
    waitUntil([&] { return gone; });
    g_bus_unwatch_name(watch);
}

std::vector<Record> posted()
{
    std::vector<Record> records;
    for (const auto &item : itemsOf("List", g_variant_new("(s)", "")))
        records.push_back(pelliko::notification::recordFrom(item.get()));
    return records;
}

std::vector<std::string> history()
{
    std::vector<std::string> lines;
    for (const auto &event : itemsOf("History", nullptr)) {
        const std::string name = word(event, "event");
        const Record record = pelliko::notification::recordFrom(event.get());
        lines.push_back(
            name + " " +
            (name == "toast" ? word(event, "message") : record.text(NOTIFICATION_TEXT_TYPE_TITLE)));
    }
    return lines;
}

void clearPanel()
{
    notification_delete_all(NOTIFICATION_TYPE_NONE);
}

notification_h make(notification_type_e type, const char *title, const char *tag)
{
    notification_h noti = notification_create(type);
    setTitle(noti, title);
    if (tag)
        notification_set_tag(noti, tag);
    return noti;
}

void setTitle(notification_h noti, const std::string &title)
{
    notification_set_text(noti, NOTIFICATION_TEXT_TYPE_TITLE, title.c_str(), nullptr,
                          NOTIFICATION_VARIABLE_TYPE_NONE);
}

std::string titleOf(notification_h noti)
{
    char *title = nullptr;
    notification_get_text(noti, NOTIFICATION_TEXT_TYPE_TITLE, &title);
    return title ? title : "";
}

} // namespace panel_testing
