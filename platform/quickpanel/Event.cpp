#include "Event.h"

namespace pelliko::quickpanel
{

Variant toVariant(const Event &event)
{
    GVariantDict dictionary;
    if (event.name == "toast") {
        g_variant_dict_init(&dictionary, nullptr);
        g_variant_dict_insert(&dictionary, "app", "s", event.record.app.c_str());
        g_variant_dict_insert(&dictionary, "message", "s", event.message.c_str());
    } else {
        g_variant_dict_init(&dictionary, notification::toVariant(event.record).get());
    }
    g_variant_dict_insert(&dictionary, "event", "s", event.name.c_str());
    g_variant_dict_insert(&dictionary, "seq", "x", event.sequence);
    g_variant_dict_insert(&dictionary, "at", "x", event.at);
    if (event.replaced != 0)
        g_variant_dict_insert(&dictionary, "replaced", "x", event.replaced);
    return Variant(g_variant_dict_end(&dictionary));
}

} // namespace pelliko::quickpanel
