// An application on the bus that remembers the launch requests it receives.
#pragma once

#include <string>
#include <vector>

#include "Bus.h"

namespace panel_testing
{

class RecordingApplication
{
public:
    explicit RecordingApplication(const char *id);
    ~RecordingApplication();
    RecordingApplication(const RecordingApplication &) = delete;
    RecordingApplication &operator=(const RecordingApplication &) = delete;

    struct Launch {
        std::string operation;
        bool replyWanted;
        Variant extras; // a{sv}

        std::string extra(const char *key) const;
    };
    const std::vector<Launch> &launches() const { return launches_; }
    bool waitForLaunches(size_t count);

private:
    static void onCall(GDBusConnection *, const gchar *, const gchar *, const gchar *,
                       const gchar *, GVariant *parameters, GDBusMethodInvocation *call,
                       gpointer self);

    Connection connection_;
    GDBusNodeInfo *interface_;
    guint object_;
    std::vector<Launch> launches_;
};

} // namespace panel_testing
