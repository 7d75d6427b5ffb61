#include "DesktopSettings.h"

#include <gio/gio.h>

#include <algorithm>
#include <cstdlib>
#include <vector>

namespace pelliko::ui
{

namespace
{

constexpr const char *schemaName = "org.gnome.desktop.interface";
constexpr const char *colorKey = "color-scheme";
constexpr const char *textKey = "text-scaling-factor";

std::vector<void (*)()> listeners;

void callListeners(GSettings *, const char *, void *)
{
    for (void (*listener)() : listeners)
        listener();
}

// GLib ends a program that asks for a schema or key that is not installed.
GSettings *openSettings()
{
    GSettingsSchemaSource *source = g_settings_schema_source_get_default();
    GSettingsSchema *schema =
        source ? g_settings_schema_source_lookup(source, schemaName, TRUE) : nullptr;
    if (!schema)
        return nullptr;
    GSettings *settings = nullptr;
    if (g_settings_schema_has_key(schema, colorKey) && g_settings_schema_has_key(schema, textKey))
        settings = g_settings_new_full(schema, nullptr, nullptr);
    g_settings_schema_unref(schema);
    if (!settings)
        return nullptr;
    for (const char *key : {colorKey, textKey}) {
        const std::string signal = std::string("changed::") + key;
        g_signal_connect(settings, signal.c_str(), G_CALLBACK(callListeners), nullptr);
    }
    return settings;
}

// Null where the desktop has no such settings.
GSettings *desktopSettings()
{
    static GSettings *settings = openSettings();
    return settings;
}

} // namespace

std::string wishedPalette()
{
    if (const char *asked = getenv("PELLIKO_COLOR_SCHEME"))
        return asked;
    if (!desktopSettings())
        return {};
    char *value = g_settings_get_string(desktopSettings(), colorKey);
    const std::string wish = value;
    g_free(value);
    if (wish == "prefer-dark")
        return "dark";
    return wish == "prefer-light" ? "light" : "";
}

double wishedTextScale()
{
    return desktopSettings()
               ? std::clamp(g_settings_get_double(desktopSettings(), textKey), 0.5, 3.0)
               : 1.0;
}

void watchDesktopSettings(void (*changed)())
{
    if (std::find(listeners.begin(), listeners.end(), changed) == listeners.end())
        listeners.push_back(changed);
    desktopSettings();
}

} // namespace pelliko::ui
