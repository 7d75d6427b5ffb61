// Notifications and events as JSON, and as lines for people.
#pragma once

#include "Variant.h"

#include <string>
#include <vector>

namespace pelliko::quickpanel_tool
{

/// All fields of all notifications, as one array over several lines.
std::string notificationsJson(const std::vector<notification::Variant> &notifications);
/// What a person looks for in a notification.
std::string notificationLine(const notification::Variant &notification);

/// Something that happened in the panel.
struct Event {
    std::string app;  ///< whose notification or toast it is
    std::string json; ///< all fields, in one line
    std::string line; ///< for people
};
Event eventOf(const notification::Variant &event);

} // namespace pelliko::quickpanel_tool
