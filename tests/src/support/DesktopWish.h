#pragma once

#include <cstdlib>
#include <gio/gio.h>

namespace pelliko::test
{

/// What the desktop's user asks of all programs, changed in this process alone and taken back at
/// the end.
class DesktopWish
{
public:
    /// Before anything of the platform is used: the settings then live in this process.
    static void keepInProcess() { setenv("GSETTINGS_BACKEND", "memory", 1); }

    DesktopWish() : settings(g_settings_new("org.gnome.desktop.interface")) {}
    ~DesktopWish()
    {
        g_settings_reset(settings, "color-scheme");
        g_settings_reset(settings, "text-scaling-factor");
        g_object_unref(settings);
    }
    DesktopWish(const DesktopWish &) = delete;
    DesktopWish &operator=(const DesktopWish &) = delete;

    void dark() { g_settings_set_string(settings, "color-scheme", "prefer-dark"); }
    void textScale(double scale) { g_settings_set_double(settings, "text-scaling-factor", scale); }

private:
    GSettings *settings;
};

} // namespace pelliko::test
