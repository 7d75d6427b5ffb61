// What reaches the panel service.
#include "ApplicationId.h"
#include "Guard.h"
#include "Handle.h"
#include "PanelClient.h"
#include "notification.h"

using namespace pelliko::notification;
using pelliko::platform::guarded;

namespace
{

const char *sender()
{
    return pelliko::platform::applicationId().c_str();
}

// For the calls that answer with a result number only.
int resultOf(const Reply &reply)
{
    if (reply.error != 0)
        return reply.error;
    gint32 result = 0;
    g_variant_get(reply.value.get(), "(i)", &result);
    return result;
}

int post(Record &record)
{
    const Variant content = toVariant(record);
    const Reply reply =
        callPanel("Post", g_variant_new("(sx@a{sv})", sender(), record.id, content.get()), "(ix)");
    if (reply.error != 0)
        return reply.error;
    gint32 result = 0;
    gint64 id = 0;
    g_variant_get(reply.value.get(), "(ix)", &result, &id);
    if (result == NOTIFICATION_ERROR_NONE)
        record.id = id;
    return result;
}

int load(const char *tag, notification_h *out)
{
    const Variant text(g_variant_new_take_string(g_utf8_make_valid(tag, -1)));
    const Reply reply =
        callPanel("LoadByTag", g_variant_new("(s@s)", sender(), text.get()), "(ia{sv})");
    if (reply.error != 0)
        return reply.error;
    gint32 result = 0;
    GVariant *found = nullptr;
    g_variant_get(reply.value.get(), "(i@a{sv})", &result, &found);
    const Variant content = Variant::adopt(found);
    if (result == NOTIFICATION_ERROR_NONE)
        *out = new _notification{recordFrom(content.get())};
    return result;
}

} // namespace

extern "C" {

int notification_post(notification_h noti)
{
    if (!noti)
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    return guarded([&] { return post(noti->record); });
}

int notification_update(notification_h noti)
{
    if (!noti)
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    if (noti->record.id == 0)
        return NOTIFICATION_ERROR_NOT_EXIST_ID;
    return guarded([&] {
        const Variant content = toVariant(noti->record);
        return resultOf(callPanel(
            "Update", g_variant_new("(sx@a{sv})", sender(), noti->record.id, content.get()),
            "(i)"));
    });
}

int notification_delete(notification_h noti)
{
    if (!noti)
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    if (noti->record.id == 0)
        return NOTIFICATION_ERROR_NOT_EXIST_ID;
    return guarded([&] {
        return resultOf(
            callPanel("Delete", g_variant_new("(sx)", sender(), noti->record.id), "(i)"));
    });
}

int notification_delete_all(notification_type_e type)
{
    if (type < NOTIFICATION_TYPE_NONE || type >= NOTIFICATION_TYPE_MAX)
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    return guarded([&] {
        return resultOf(callPanel(
            "DeleteAll", g_variant_new("(si)", sender(), static_cast<gint32>(type)), "(i)"));
    });
}

notification_h notification_load_by_tag(const char *tag)
{
    notification_h loaded = nullptr;
    const int result = tag ? guarded([&] { return load(tag, &loaded); })
                           : static_cast<int>(NOTIFICATION_ERROR_INVALID_PARAMETER);
    set_last_result(result);
    return loaded;
}

int notification_status_message_post(const char *message)
{
    if (!message)
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    return guarded([&] {
        const Variant text(g_variant_new_take_string(g_utf8_make_valid(message, -1)));
        return resultOf(callPanel("Toast", g_variant_new("(s@s)", sender(), text.get()), "(i)"));
    });
}
}
