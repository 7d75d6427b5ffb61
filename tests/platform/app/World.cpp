#include "World.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>

#include <gtest/gtest.h>

namespace pelliko::test
{

namespace
{

GSubprocess *spawnWith(const std::vector<std::string> &command, const Environment &environment,
                       GSubprocessFlags flags)
{
    std::vector<const char *> words;
    for (const std::string &word : command)
        words.push_back(word.c_str());
    words.push_back(nullptr);
    g_autoptr(GSubprocessLauncher) launcher = g_subprocess_launcher_new(flags);
    for (const auto &[name, value] : environment)
        g_subprocess_launcher_setenv(launcher, name.c_str(), value.c_str(), TRUE);
    g_autoptr(GError) error = nullptr;
    GSubprocess *process = g_subprocess_launcher_spawnv(launcher, words.data(), &error);
    if (!process)
        ADD_FAILURE() << error->message;
    return process;
}

std::string owned(char *text)
{
    std::string copy = text ? text : "";
    g_free(text);
    return copy;
}

GDBusConnection *bus()
{
    static GDBusConnection *connection = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, nullptr);
    return connection;
}

GVariant *askBus(const char *method, GVariant *arguments)
{
    return g_dbus_connection_call_sync(bus(), "org.freedesktop.DBus", "/org/freedesktop/DBus",
                                       "org.freedesktop.DBus", method, arguments, nullptr,
                                       G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr);
}

void install(const std::string &id, const Environment &environment)
{
    const std::string folder = std::string(std::getenv("XDG_DATA_HOME")) + "/dbus-1/services";
    std::filesystem::create_directories(folder);
    std::ofstream file(folder + "/" + id + ".service");
    file << "[D-BUS Service]\nName=" << id << "\nExec=/usr/bin/env";
    for (const auto &[name, value] : environment)
        file << " " << name << "=" << value;
    file << " " << program("app-recorder") << "\n";
    file.close();
    g_autoptr(GVariant) reply = askBus("ReloadConfig", nullptr);
}

} // namespace

std::string program(const std::string &name)
{
    const std::string built = std::string(PELLIKO_BUILD_DIR) + "/bin/" + name;
    return std::filesystem::exists(built) ? built
                                          : std::string(PELLIKO_BUILD_DIR) + "/tests/" + name;
}

Ended run(const std::vector<std::string> &command, const Environment &environment)
{
    g_autoptr(GSubprocess) process =
        spawnWith(command, environment,
                  static_cast<GSubprocessFlags>(G_SUBPROCESS_FLAGS_STDOUT_PIPE |
                                                G_SUBPROCESS_FLAGS_STDERR_PIPE));
    char *out = nullptr;
    char *err = nullptr;
    g_subprocess_communicate_utf8(process, nullptr, nullptr, &out, &err, nullptr);
    const int status = g_subprocess_get_if_exited(process) ? g_subprocess_get_exit_status(process)
                                                           : -g_subprocess_get_term_sig(process);
    return {status, owned(out), owned(err)};
}

Ended appLaunch(const std::vector<std::string> &arguments)
{
    std::vector<std::string> command{program("app-launch")};
    command.insert(command.end(), arguments.begin(), arguments.end());
    return run(command);
}

bool turnUntil(const std::function<bool()> &done, unsigned seconds)
{
    bool late = false;
    const guint timer = g_timeout_add_seconds(
        seconds,
        [](gpointer flag) -> gboolean {
            *static_cast<bool *>(flag) = true;
            return G_SOURCE_CONTINUE;
        },
        &late);
    while (!done() && !late)
        g_main_context_iteration(nullptr, TRUE);
    g_source_remove(timer);
    return done();
}

RecorderApp::RecorderApp(const std::string &name, bool installed) : id_("com.velmora.test" + name)
{
    g_autofree char *folder = g_dir_make_tmp("recorder-XXXXXX", nullptr);
    folder_ = folder;
    log_ = folder_ + "/diary";
    if (installed)
        install(id_, environment());
}

Environment RecorderApp::environment() const
{
    return {{"PELLIKO_APP_ID", id_},
            {"RECORDER_LOG", log_},
            {"EINA_LOG_BACKTRACE", "-1"},
            {"ASAN_OPTIONS", "detect_leaks=0"}};
}

Ended RecorderApp::startByHand(const std::vector<std::string> &arguments, Environment extra) const
{
    std::vector<std::string> command{program("app-recorder")};
    command.insert(command.end(), arguments.begin(), arguments.end());
    extra.merge(environment());
    return run(command, extra);
}

GSubprocess *RecorderApp::spawn() const
{
    return spawnWith({program("app-recorder")}, environment(), G_SUBPROCESS_FLAGS_NONE);
}

std::vector<std::string> RecorderApp::diary() const
{
    std::ifstream file(log_);
    std::vector<std::string> lines;
    for (std::string line; std::getline(file, line);)
        lines.push_back(line);
    return lines;
}

std::vector<std::string> RecorderApp::diaryWith(const std::string &start) const
{
    const auto begins = [&](const std::string &line) { return line.rfind(start, 0) == 0; };
    g_autoptr(GFile) file = g_file_new_for_path(folder_.c_str());
    // Its changes wake the loop; each turn looks at the diary again.
    g_autoptr(GFileMonitor) monitor =
        g_file_monitor_directory(file, G_FILE_MONITOR_NONE, nullptr, nullptr);
    std::vector<std::string> lines;
    turnUntil([&] {
        lines = diary();
        return std::any_of(lines.begin(), lines.end(), begins);
    });
    return lines;
}

bool RecorderApp::waitUntilGone() const
{
    bool gone = false;
    const guint watch = g_bus_watch_name_on_connection(
        bus(), id_.c_str(), G_BUS_NAME_WATCHER_FLAGS_NONE, nullptr,
        [](GDBusConnection *, const gchar *, gpointer flag) { *static_cast<bool *>(flag) = true; },
        &gone, nullptr);
    turnUntil([&] { return gone; });
    g_bus_unwatch_name(watch);
    return gone;
}

} // namespace pelliko::test
