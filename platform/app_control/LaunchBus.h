// Names and calls of the bus that sending and receiving have in common.
#pragma once

#include <gio/gio.h>

#include <string>

namespace pelliko::platform
{

constexpr const char *kLaunchInterface = "com.velmora.Platform.Application1";
/// The callee is ending and did not look at the request.
constexpr const char *kLeavingError = "com.velmora.Platform.Error.Leaving";

/// The user's session bus, connected once per process and never released; NULL with the reason in
/// `error`. Any thread.
GDBusConnection *sessionBus(GError **error);

/// A call of the bus itself; the reply is the caller's. Any thread.
GVariant *callBus(const char *method, GVariant *arguments, const char *replyType, GError **error);

/// Does anybody own this bus name? False also when there is no bus. Any thread.
bool nameHasOwner(const std::string &name);

/// Is this a name that an application can have on the bus?
bool isApplicationId(const char *id);

} // namespace pelliko::platform
