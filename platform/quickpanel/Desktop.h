// The connection to the desktop's notification daemon, which may be missing, come late and go.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include <gio/gio.h>

#include "Presentation.h"

namespace pelliko::quickpanel
{

using notification::Variant;

// Main loop only. Every function of the owner is called from the loop, never from inside a call.
class Desktop
{
public:
    struct Listener {
        std::function<void()> appeared; // a daemon is there and has told what it can do
        std::function<void()>
            vanished; // it went, and everything it showed with it; or there never was one
        std::function<void(uint32_t number)> tapped;
        std::function<void(uint32_t number, bool by_user)> closed;
    };
    // number is 0 when nothing is shown.
    using Shown = std::function<void(uint32_t number)>;

    Desktop(GDBusConnection *bus, Listener listener);
    ~Desktop();
    Desktop(const Desktop &) = delete;
    Desktop &operator=(const Desktop &) = delete;

    bool isPresent() const { return ready_; }
    // The daemon's unique bus name, empty while there is none.
    const std::string &owner() const { return owner_; }

    // Shows something new, or in place of `replaces` when that is not 0. The bus starts a missing
    // daemon when one is installed.
    void show(const Presentation &what, uint32_t replaces, Shown done);
    void close(uint32_t number);

private:
    struct Pending {
        Presentation what;
        uint32_t replaces;
        Shown done;
    };

    static void onAppeared(GDBusConnection *, const gchar *, const gchar *owner, gpointer self);
    static void onVanished(GDBusConnection *, const gchar *, gpointer self);
    static void onSignal(GDBusConnection *, const gchar *, const gchar *, const gchar *,
                         const gchar *signal, GVariant *parameters, gpointer self);
    static void onCapabilities(GObject *bus, GAsyncResult *result, gpointer self);
    static void onShown(GObject *bus, GAsyncResult *result, gpointer call);

    void askCapabilities();
    void becomeReady();
    void askedInVain(const GError *error);
    void send(const Pending &pending);

    GDBusConnection *bus_;
    Listener listener_;
    GCancellable *cancel_;
    guint watch_;
    guint signals_;
    std::string owner_;
    bool asking_ = false;
    bool answered_ = false; // by the present owner, about its capabilities
    bool ready_ = false;
    bool markup_ = false;
    std::vector<Pending> pending_;
};

} // namespace pelliko::quickpanel
