// The way to services of the machine.
#pragma once

#include <gio/gio.h>
#include <memory>
#include <string>

namespace pelliko::modem
{

struct VariantRelease {
    void operator()(GVariant *variant) const { g_variant_unref(variant); }
};
using VariantPtr = std::unique_ptr<GVariant, VariantRelease>;

/// The process's connection to the system bus, kept for the life of the process; NULL when there is
/// no system bus. The process survives the end of the bus. Any thread.
GDBusConnection *systemBus();

/// Whether somebody owns `name` on the system bus. Any thread, blocks for at most five seconds.
bool isOnSystemBus(const char *name);

/// Has the bus start `name` when it is not running and can be started; returns when it runs, or has
/// failed to. Any thread, blocks for at most 25 seconds.
void startOnSystemBus(const char *name);

/// Calls a method of a running service (nobody is started for it). NULL and a reason in `error`
/// when that failed. Takes `arguments` when they are floating. Any thread, blocks for at most
/// `timeoutMs`.
VariantPtr callOnSystemBus(const char *name, const std::string &path, const char *interface,
                           const char *method, GVariant *arguments, int timeoutMs,
                           std::string &error);

} // namespace pelliko::modem
