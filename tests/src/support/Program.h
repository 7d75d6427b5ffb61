#pragma once

#include <csignal>
#include <gio/gio.h>
#include <string>
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

    /// False when the application has not ended within 20 seconds.
    bool waitForExit()
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
        GSource *bound = g_timeout_source_new_seconds(20);
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

    /// Ends a running application and waits for it.
    void end()
    {
        const pid_t pid = process();
        if (pid == 0)
            return;
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
    GDBusConnection *bus_;
};

} // namespace pelliko::test
