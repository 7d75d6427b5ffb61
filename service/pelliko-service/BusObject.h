// What the service's objects on the bus have in common
#pragma once

#include <functional>
#include <gio/gio.h>
#include <vector>

namespace pelliko::service
{

constexpr const char *busObjectPath = "/com/velmora/pelliko/Service";

/** Puts an interface on the bus; `what` names it in the warning when that fails. */
void exportOnBus(GDBusInterfaceSkeleton *skeleton, GDBusConnection *bus, const char *what);

using BusCall = std::function<void()>;

/** Runs a call, which answers its invocation; one that throws is answered with an error. */
void answerCall(GDBusMethodInvocation *invocation, const BusCall &call);

/**
 * Calls that wait until the queue is loaded. A call outlives the emission that brought it: what it
 * needs of its parameters it owns, or it takes them from the invocation, which lives as long.
 */
class HeldCalls
{
public:
    void add(GDBusMethodInvocation *invocation, BusCall call);
    /** Runs them, oldest first. */
    void answer();
    /** Tells every caller that the service is not ready, and why. */
    void refuse(const char *reason);

private:
    struct Held {
        GDBusMethodInvocation *invocation;
        BusCall call;
    };
    std::vector<Held> held_;
};

} // namespace pelliko::service
