#include "Presentation.h"

#include <cmath>

#include <gio/gdesktopappinfo.h>

#include "Icons.h"
#include "notification.h"

namespace pelliko::quickpanel
{
namespace
{

using notification::Record;
using notification::Variant;

constexpr int tickerMs = 4000;
constexpr int toastMs = 3000;
constexpr guint8 normalUrgency = 1;

std::string nameOf(const std::string &app)
{
    GDesktopAppInfo *info = g_desktop_app_info_new((app + ".desktop").c_str());
    if (!info)
        return app;
    std::string name = g_app_info_get_display_name(G_APP_INFO(info));
    g_object_unref(info);
    return name;
}

int percentOf(const Record &record)
{
    return static_cast<int>(std::lround(record.progress * 100));
}

std::string iconOf(const Record &record)
{
    for (const int kind : {NOTIFICATION_IMAGE_TYPE_ICON, NOTIFICATION_IMAGE_TYPE_THUMBNAIL,
                           NOTIFICATION_IMAGE_TYPE_ICON_FOR_INDICATOR}) {
        const auto found = record.images.find(kind);
        if (found != record.images.end())
            return movingIcon(found->second, percentOf(record));
    }
    return {};
}

std::string summaryOf(const Record &record)
{
    const std::string title = record.text(NOTIFICATION_TEXT_TYPE_TITLE);
    const std::string count = record.text(NOTIFICATION_TEXT_TYPE_EVENT_COUNT);
    return count.empty() ? title : title + " (" + count + ")";
}

std::string bodyOf(const Record &record)
{
    const std::string content = record.text(NOTIFICATION_TEXT_TYPE_CONTENT);
    const std::string info = record.text(NOTIFICATION_TEXT_TYPE_INFO_1);
    return content.empty() || info.empty() ? content + info : content + "\n" + info;
}

void addSound(GVariantDict *hints, const Record &record)
{
    if (record.sound == NOTIFICATION_SOUND_TYPE_DEFAULT)
        g_variant_dict_insert(hints, "sound-name", "s", "message-new-instant");
    else if (record.sound == NOTIFICATION_SOUND_TYPE_USER_DATA && !record.soundPath.empty())
        g_variant_dict_insert(hints, "sound-file", "s", record.soundPath.c_str());
}

Variant hintsOf(const Record &record)
{
    GVariantDict hints;
    g_variant_dict_init(&hints, nullptr);
    g_variant_dict_insert(&hints, "urgency", "y", normalUrgency);
    g_variant_dict_insert(&hints, "desktop-entry", "s", record.app.c_str());
    if (record.layout == NOTIFICATION_LY_ONGOING_PROGRESS)
        g_variant_dict_insert(&hints, "value", "i", percentOf(record));
    if (record.isOngoing()) {
        g_variant_dict_insert(&hints, "category", "s", "transfer");
        g_variant_dict_insert(&hints, "resident", "b", TRUE);
    }
    if (record.isTicker())
        g_variant_dict_insert(&hints, "transient", "b", TRUE);
    addSound(&hints, record);
    return Variant(g_variant_dict_end(&hints));
}

} // namespace

bool isShown(const Record &record)
{
    return record.isInTray() || record.isTicker();
}

Presentation presentationOf(const Record &record)
{
    return {nameOf(record.app),
            iconOf(record),
            summaryOf(record),
            bodyOf(record),
            hintsOf(record),
            record.isTicker() ? tickerMs : 0,
            true};
}

Presentation toastOf(const std::string &app, const std::string &message)
{
    GVariantDict hints;
    g_variant_dict_init(&hints, nullptr);
    g_variant_dict_insert(&hints, "urgency", "y", normalUrgency);
    g_variant_dict_insert(&hints, "transient", "b", TRUE);
    return {nameOf(app), "", message, "", Variant(g_variant_dict_end(&hints)), toastMs, false};
}

} // namespace pelliko::quickpanel
