// What a notification consists of, as it travels to the panel service and rests in its record.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include <gio/gio.h>

#include "Variant.h"

namespace pelliko::notification
{

struct Text {
    std::string shown;
    std::string key;             // message id, empty when there is none
    std::vector<Variant> values; // the arguments that went into the shown text: i, d or s
};

struct Record {
    int64_t id = 0;  // private id, 0 while never posted
    std::string app; // set by the panel service only
    std::string tag; // empty when there is none
    int type = 0;
    int layout = 0;
    int display = 0;
    double progress = 0.0;
    int64_t time = 0; // seconds since the epoch, 0 when not set
    int sound = -1;
    std::string soundPath;
    std::map<int, Text> texts;
    std::map<int, std::string> images;
    Variant launch; // a{sv}, null when a tap does nothing

    bool isOngoing() const;
    bool isInTray() const;
    // Shown for a moment only.
    bool isTicker() const;
    // Empty when the text is not set.
    std::string text(int kind) const;
};

// The form described in dbus/com.velmora.Platform.Panel1.xml. Bytes that are not UTF-8 become
// U+FFFD.
Variant toVariant(const Record &record);
// Unknown keys and values of another type are ignored, so that an older side can read a newer one.
Record recordFrom(GVariant *dictionary);

} // namespace pelliko::notification
