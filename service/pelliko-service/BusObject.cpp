#include "BusObject.h"

#include <exception>
#include <utility>

namespace pelliko::service
{
namespace
{
constexpr const char *initializingError = "com.velmora.pelliko.Service.Error.Initializing";
} // namespace

void exportOnBus(GDBusInterfaceSkeleton *skeleton, GDBusConnection *bus, const char *what)
{
    g_autoptr(GError) error = nullptr;
    if (!g_dbus_interface_skeleton_export(skeleton, bus, busObjectPath, &error)) {
        g_warning("%s cannot be put on the bus: %s", what, error->message);
    }
}

void answerCall(GDBusMethodInvocation *invocation, const BusCall &call)
{
    try {
        call();
    } catch (const std::exception &fault) {
        g_warning("a call cannot be answered: %s", fault.what());
        g_dbus_method_invocation_return_error_literal(invocation, G_DBUS_ERROR, G_DBUS_ERROR_FAILED,
                                                      "the queue cannot be read");
    }
}

void HeldCalls::add(GDBusMethodInvocation *invocation, BusCall call)
{
    held_.push_back({invocation, std::move(call)});
}

void HeldCalls::answer()
{
    for (const Held &held : std::exchange(held_, {})) {
        answerCall(held.invocation, held.call);
    }
}

void HeldCalls::refuse(const char *reason)
{
    for (const Held &held : std::exchange(held_, {})) {
        g_dbus_method_invocation_return_dbus_error(held.invocation, initializingError, reason);
    }
}

} // namespace pelliko::service
