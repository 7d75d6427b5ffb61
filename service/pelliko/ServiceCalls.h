// Calls of the service that do not wait
#pragma once

#include <gio/gio.h>

#include <cstdint>
#include <functional>

namespace pelliko::client
{

/** @param error 0, or why there is no reply @param reply borrowed, null with an error */
using CallDone = std::function<void(int error, GVariant *reply)>;

/**
 * Calls a method of the shares' interface without waiting.
 * @param arguments floating, null for none
 * @param done      called from the main loop, once, unless the call is stopped
 * @return the call's number; 0 when there is no bus
 */
uint32_t callService(const char *method, GVariant *arguments, CallDone done);

/** A number for a call that is not made yet: the next one gets it. */
uint32_t nextCallNumber();

/** Its done is not called any more. @return whether the call was under way */
bool stopCall(uint32_t call);

/** The connection to the session bus, made on first use; borrowed, null when there is none. */
GDBusConnection *sessionBus();

} // namespace pelliko::client
