#include "Phone.h"

#include <cstdlib>
#include <fstream>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

namespace phone
{

namespace
{

std::streamoff forgotten = 0;

GDBusConnection *systemBus()
{
    return g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr);
}

std::string readLine(int fd)
{
    std::string line;
    for (char c = 0; read(fd, &c, 1) == 1 && c != '\n';)
        line += c;
    return line;
}

} // namespace

std::string tell(const std::string &command)
{
    const int fd = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    std::string(std::getenv("PELLIKO_PHONE")).copy(address.sun_path, sizeof address.sun_path - 1);
    const std::string line = command + "\n";
    std::string answer = "no phone";
    if (connect(fd, reinterpret_cast<const sockaddr *>(&address), sizeof address) == 0 &&
        write(fd, line.data(), line.size()) == static_cast<ssize_t>(line.size()))
        answer = readLine(fd);
    close(fd);
    return answer;
}

std::vector<pelliko::test::JsonValue> messages()
{
    std::vector<pelliko::test::JsonValue> result;
    std::ifstream file(std::getenv("PELLIKO_SMS_OUTBOX"));
    file.seekg(forgotten);
    for (std::string line; std::getline(file, line);)
        result.push_back(pelliko::test::JsonValue::parse(line));
    return result;
}

void forgetMessages()
{
    std::ifstream file(std::getenv("PELLIKO_SMS_OUTBOX"), std::ios::ate);
    forgotten = file ? static_cast<std::streamoff>(file.tellg()) : 0;
}

bool turnUntil(const std::function<bool()> &condition, unsigned seconds)
{
    bool late = false;
    const auto expire = [](gpointer flag) -> gboolean {
        *static_cast<bool *>(flag) = true;
        return G_SOURCE_CONTINUE;
    };
    const guint timer = g_timeout_add_seconds(seconds, expire, &late);
    while (!condition() && !late)
        g_main_context_iteration(nullptr, TRUE);
    g_source_remove(timer);
    return !late;
}

OfonoDouble::OfonoDouble()
{
    bool here = false;
    const auto appeared = [](GDBusConnection *, const gchar *, const gchar *, gpointer flag) {
        *static_cast<bool *>(flag) = true;
    };
    const guint watch = g_bus_watch_name_on_connection(
        systemBus(), "org.ofono", G_BUS_NAME_WATCHER_FLAGS_NONE, appeared, nullptr, &here, nullptr);
    process_ = g_subprocess_new(G_SUBPROCESS_FLAGS_STDOUT_SILENCE, nullptr, "/usr/bin/python3",
                                "-m", "dbusmock", "--system", "--template", "ofono", nullptr);
    // The modem is on the bus before the name is.
    if (!turnUntil([&] { return here; }))
        g_clear_object(&process_);
    g_bus_unwatch_name(watch);
}

OfonoDouble::~OfonoDouble()
{
    if (!process_)
        return;
    g_subprocess_force_exit(process_);
    g_subprocess_wait(process_, nullptr, nullptr);
    g_object_unref(process_);
}

void OfonoDouble::call(const char *path, const char *interface, const char *method,
                       GVariant *arguments)
{
    GVariant *reply =
        g_dbus_connection_call_sync(systemBus(), "org.ofono", path, interface, method, arguments,
                                    nullptr, G_DBUS_CALL_FLAGS_NONE, 5000, nullptr, nullptr);
    if (reply)
        g_variant_unref(reply);
}

void OfonoDouble::setSim(const char *property, GVariant *value)
{
    call("/ril_0", "org.ofono.SimManager", "SetProperty", g_variant_new("(sv)", property, value));
}

void OfonoDouble::addModem(const char *name)
{
    call("/", "org.freedesktop.DBus.Mock", "AddModem", g_variant_new("(sa{sv})", name, nullptr));
}

void OfonoDouble::setConnection(const char *modem, bool up)
{
    const std::string answer =
        std::string("ret = [(dbus.ObjectPath('/context'), {'Active': dbus.Boolean(") +
        (up ? "True" : "False") + ", variant_level=1)})]";
    call(modem, "org.freedesktop.DBus.Mock", "AddMethod",
         g_variant_new("(sssss)", "org.ofono.ConnectionManager", "GetContexts", "", "a(oa{sv})",
                       answer.c_str()));
}

} // namespace phone
