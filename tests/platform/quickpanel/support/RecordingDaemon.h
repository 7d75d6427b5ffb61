// A notification daemon that shows nothing and remembers everything, for what a real one cannot be
// asked about.
#pragma once

#include <cstdint>
#include <set>
#include <string>
#include <vector>

#include "Bus.h"

namespace panel_testing
{

struct Shown {
    uint32_t number; // the number that the daemon answered
    uint32_t replaces;
    std::string application;
    std::string icon;
    std::string summary;
    std::string body;
    std::vector<std::string> actions;
    Variant hints;
    int timeoutMs;

    // The hint printed as text, for example "42" or "true"; empty when absent.
    std::string hint(const char *name) const;
};

class RecordingDaemon
{
public:
    explicit RecordingDaemon(std::vector<std::string> capabilities = {"body", "actions"});
    ~RecordingDaemon();
    RecordingDaemon(const RecordingDaemon &) = delete;
    RecordingDaemon &operator=(const RecordingDaemon &) = delete;

    // Every Notify so far.
    const std::vector<Shown> &calls() const { return calls_; }
    // What would be on the screen.
    const std::set<uint32_t> &visible() const { return visible_; }
    // Waits for that many Notify calls in all.
    bool waitForCalls(size_t count);
    bool waitForVisible(size_t count);

    void tap(uint32_t number);
    void close(uint32_t number, uint32_t reason);

private:
    static void onCall(GDBusConnection *, const gchar *, const gchar *, const gchar *,
                       const gchar *method, GVariant *parameters, GDBusMethodInvocation *call,
                       gpointer self);
    uint32_t notify(GVariant *parameters);

    Connection connection_;
    GDBusNodeInfo *interface_;
    guint object_;
    std::vector<std::string> capabilities_;
    std::vector<Shown> calls_;
    std::set<uint32_t> visible_;
    uint32_t last_ = 0;
};

} // namespace panel_testing
