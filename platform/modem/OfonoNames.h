// Names of oFono's bus interfaces and how its answers are read.
#pragma once

#include "SystemBus.h"

#include <string>

namespace pelliko::modem::ofono
{

constexpr const char *kService = "org.ofono";
constexpr const char *kManager = "org.ofono.Manager";
constexpr const char *kModem = "org.ofono.Modem";
constexpr const char *kSimManager = "org.ofono.SimManager";
constexpr const char *kConnectionManager = "org.ofono.ConnectionManager";
constexpr const char *kConnectionContext = "org.ofono.ConnectionContext";
constexpr const char *kMessageManager = "org.ofono.MessageManager";
constexpr const char *kMessage = "org.ofono.Message";

/// A text of a dictionary a{sv}; empty when it is not there.
std::string textOf(GVariant *properties, const char *name);
/// A flag of a dictionary a{sv}; false when it is not there.
bool flagOf(GVariant *properties, const char *name);
/// Whether the list of interfaces ("as") has `name`.
bool lists(GVariant *interfaces, const char *name);
/// Whether a modem with these properties has the interface now.
bool hasInterface(GVariant *modemProperties, const char *name);

} // namespace pelliko::modem::ofono
