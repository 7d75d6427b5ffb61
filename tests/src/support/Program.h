#pragma once

#include <csignal>
#include <filesystem>
#include <fstream>
#include <gio/gio.h>
#include <poll.h>
#include <string>
#include <sys/syscall.h>
#include <unistd.h>
#include <vector>

namespace pelliko::test
{

constexpr const char *pellikoName = "com.velmora.pelliko";

struct Finished {
    int status = -1; ///< exit status
    std::string output;
};

/// Runs a program to its end.
inline Finished run(const std::vector<std::string> &words)
{
    std::vector<const char *> argv;
    for (const std::string &word : words)
        argv.push_back(word.c_str());
    argv.push_back(nullptr);
    char *output = nullptr;
    int wait_status = 0;
    Finished finished;
    if (g_spawn_sync(nullptr, const_cast<char **>(argv.data()), nullptr, G_SPAWN_SEARCH_PATH,
                     nullptr, nullptr, &output, nullptr, &wait_status, nullptr)) {
        finished.status = g_spawn_check_wait_status(wait_status, nullptr) ? 0 : 1;
        finished.output = output;
    }
    g_free(output);
    return finished;
}

/// The application as the bus starts it.
class Pelliko
{
public:
    Pelliko() : bus_(g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, nullptr)) {}
    ~Pelliko() { g_object_unref(bus_); }
    Pelliko(const Pelliko &) = delete;
    Pelliko &operator=(const Pelliko &) = delete;

    /// Sends a launch request; returns when the application has dealt with it, or (--wait-reply)
    /// has answered.
    Finished launch(const std::string &operation, std::vector<std::string> more = {})
    {
        std::vector<std::string> words = {"app-launch", "--app", pellikoName, "--operation",
                                          "appcontrol/operation/" + operation};
        words.insert(words.end(), more.begin(), more.end());
        return run(words);
    }

    bool running() const { return process() != 0; }

    /// False when the application has not ended within 20 seconds. It leaves the bus first and then
    /// waits for its workers, so both ends are waited for.
    bool waitForExit() { return waitForName() && waitForProcesses(); }

    /// Ends a running application and waits for it.
    void end()
    {
        if (const pid_t pid = process())
            kill(pid, SIGTERM);
        waitForExit();
    }

    /// Its process id, 0 when it does not run.
    pid_t process() const
    {
        GVariant *reply = g_dbus_connection_call_sync(
            bus_, "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
            "GetConnectionUnixProcessID", g_variant_new("(s)", pellikoName), G_VARIANT_TYPE("(u)"),
            G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr);
        guint32 pid = 0;
        if (reply) {
            g_variant_get(reply, "(u)", &pid);
            g_variant_unref(reply);
        }
        return static_cast<pid_t>(pid);
    }

private:
    struct State {
        bool gone = false;
        bool late = false;
    };
    static constexpr unsigned int bound_seconds = 20;

    bool waitForName()
    {
        GMainContext *context = g_main_context_new();
        g_main_context_push_thread_default(context);
        State state;
        const guint watch = g_bus_watch_name_on_connection(
            bus_, pellikoName, G_BUS_NAME_WATCHER_FLAGS_NONE, nullptr,
            [](GDBusConnection *, const char *, void *data) {
                static_cast<State *>(data)->gone = true;
            },
            &state, nullptr);
        GSource *bound = g_timeout_source_new_seconds(bound_seconds);
        g_source_set_callback(
            bound,
            [](void *data) -> gboolean {
                static_cast<State *>(data)->late = true;
                return G_SOURCE_REMOVE;
            },
            &state, nullptr);
        g_source_attach(bound, context);
        while (!state.gone && !state.late)
            g_main_context_iteration(context, TRUE);
        g_source_destroy(bound);
        g_source_unref(bound);
        g_bus_unwatch_name(watch);
        g_main_context_pop_thread_default(context);
        g_main_context_unref(context);
        return state.gone;
    }

    // The world has process ids of its own: every process of that name is the application.
    static bool waitForProcesses()
    {
        for (const auto &entry : std::filesystem::directory_iterator("/proc")) {
            std::string name;
            std::getline(std::ifstream(entry.path() / "comm"), name);
            if (name == "pelliko" && !waitForProcess(std::stoi(entry.path().filename())))
                return false;
        }
        return true;
    }

    static bool waitForProcess(pid_t pid)
    {
        const int fd = static_cast<int>(syscall(SYS_pidfd_open, pid, 0));
        if (fd < 0)
            return true; // gone meanwhile
        pollfd ended = {fd, POLLIN, 0};
        const int ready = poll(&ended, 1, static_cast<int>(bound_seconds) * 1000);
        close(fd);
        return ready == 1;
    }

    GDBusConnection *bus_;
};

} // namespace pelliko::test
