// Notifications and events as JSON.
#pragma once

#include <nlohmann/json.hpp>

#include "Variant.h"

namespace pelliko::quickpanel_tool
{

nlohmann::ordered_json notificationJson(const notification::Variant &notification);
nlohmann::ordered_json eventJson(const notification::Variant &event);

} // namespace pelliko::quickpanel_tool
