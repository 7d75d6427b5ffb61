#include "PanelCalls.h"

#include <stdexcept>

#include "PanelClient.h"
#include "Record.h"
#include "notification.h"

namespace pelliko::quickpanel_tool
{
namespace
{

Variant call(const char *method, GVariant *parameters, const char *reply_type)
{
    const notification::Reply reply = notification::callPanel(method, parameters, reply_type);
    if (reply.error != 0)
        throw std::runtime_error("the panel service did not answer");
    return reply.value;
}

std::vector<Variant> itemsOf(const Variant &tuple)
{
    const Variant array = Variant::adopt(g_variant_get_child_value(tuple.get(), 0));
    std::vector<Variant> items;
    for (gsize i = 0; i < g_variant_n_children(array.get()); ++i)
        items.push_back(Variant::adopt(g_variant_get_child_value(array.get(), i)));
    return items;
}

std::string describe(int result)
{
    if (result == NOTIFICATION_ERROR_NOT_EXIST_ID)
        return "no such notification is posted";
    if (result == TIZEN_ERROR_NOT_PERMITTED)
        return "an ongoing notification cannot be swiped away";
    return "the panel service refused (" + std::to_string(result) + ")";
}

void act(const char *method, int64_t id)
{
    const Variant reply = call(method, g_variant_new("(x)", id), "(i)");
    gint32 result = 0;
    g_variant_get(reply.get(), "(i)", &result);
    if (result != 0)
        throw std::runtime_error(describe(result));
}

} // namespace

std::vector<Variant> postedNotifications(const std::string &app)
{
    return itemsOf(call("List", g_variant_new("(s)", app.c_str()), "(aa{sv})"));
}

std::vector<Variant> pastEvents()
{
    return itemsOf(call("History", nullptr, "(aa{sv})"));
}

int64_t resolve(const std::string &id_or_tag, const std::string &app)
{
    int64_t by_id = 0;
    int64_t by_tag = 0;
    for (const Variant &item : postedNotifications(app)) {
        const auto record = notification::recordFrom(item.get());
        if (record.tag == id_or_tag) {
            if (by_tag != 0)
                throw std::runtime_error("several applications use the tag " + id_or_tag +
                                         ", name one with --app");
            by_tag = record.id;
        }
        if (std::to_string(record.id) == id_or_tag)
            by_id = record.id;
    }
    if (by_tag == 0 && by_id == 0)
        throw std::runtime_error("nothing posted has the tag or private id " + id_or_tag);
    return by_tag != 0 ? by_tag : by_id;
}

void tap(int64_t id)
{
    act("Tap", id);
}

void swipe(int64_t id)
{
    act("Swipe", id);
}

} // namespace pelliko::quickpanel_tool
