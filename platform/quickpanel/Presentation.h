// What the desktop's notification daemon is told about a notification.
#pragma once

#include <string>

#include "Record.h"

namespace pelliko::quickpanel
{

// The arguments of org.freedesktop.Notifications.Notify, but for the number to replace.
struct Presentation {
    std::string application; // a name for people where one is known
    std::string icon;
    std::string summary;
    std::string body; // plain text
    notification::Variant hints;
    int timeoutMs = 0; // 0: stays
    bool tappable = false;
};

// Nothing of a notification without tray and ticker appears on a desktop.
bool isShown(const notification::Record &record);
Presentation presentationOf(const notification::Record &record);
Presentation toastOf(const std::string &app, const std::string &message);

} // namespace pelliko::quickpanel
