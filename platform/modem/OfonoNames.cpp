#include "OfonoNames.h"

namespace pelliko::modem::ofono
{

std::string textOf(GVariant *properties, const char *name)
{
    const VariantPtr value(g_variant_lookup_value(properties, name, G_VARIANT_TYPE_STRING));
    return value ? g_variant_get_string(value.get(), nullptr) : "";
}

bool flagOf(GVariant *properties, const char *name)
{
    const VariantPtr value(g_variant_lookup_value(properties, name, G_VARIANT_TYPE_BOOLEAN));
    return value && g_variant_get_boolean(value.get());
}

bool lists(GVariant *interfaces, const char *name)
{
    const gchar **names = g_variant_get_strv(interfaces, nullptr);
    const bool found = g_strv_contains(names, name);
    g_free(names);
    return found;
}

bool hasInterface(GVariant *modemProperties, const char *name)
{
    const VariantPtr interfaces(
        g_variant_lookup_value(modemProperties, "Interfaces", G_VARIANT_TYPE_STRING_ARRAY));
    return interfaces && lists(interfaces.get(), name);
}

} // namespace pelliko::modem::ofono
