// A launch request as a GVariant, for the bus and for whoever keeps a request for later.
#pragma once

#include "app_control.h"

#include <gio/gio.h>

#include <string>

namespace pelliko::platform
{

/// The request as a floating a{sv}: "operation", "uri", "mime", "app_id" as far as they are set and
/// "extras" (a{sv}, each a text or an array of texts). Texts that are not UTF-8 travel as byte
/// strings, so any file name survives. NULL for a null handle.
GVariant *toVariant(app_control_h request);

/// A new request from such a dictionary, for app_control_destroy. Unknown entries and entries of a
/// foreign type are left out. NULL when `request` is NULL or no a{sv}. Takes no reference.
app_control_h fromVariant(GVariant *request);

/// The extra data alone, as a floating a{sv}; and into a handle, beside what is there.
GVariant *extrasToVariant(app_control_h request);
void addExtrasFromVariant(app_control_h request, GVariant *extras);

/// The same request as JSON text, with "extras" as an object of texts and arrays; bytes that are
/// not UTF-8 become U+FFFD. For logs and command-line tools.
std::string toJson(app_control_h request);

/// The extra data as one JSON object.
std::string extrasToJson(app_control_h request);

} // namespace pelliko::platform
