// Which posted notification is shown under which of the desktop's numbers, and how often it may
// change there.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <optional>

#include "Desktop.h"
#include "Store.h"

namespace pelliko::quickpanel
{

// Main loop only.
class Display
{
public:
    struct Listener {
        // The content to show; asked for when it is sent, so that the newest is shown.
        std::function<std::optional<Record>(int64_t id)> content;
        // What belongs on the desktop whenever a daemon comes.
        std::function<void()> refill;
        std::function<void(int64_t id, const DesktopId &shown)> shownAs;
        // It could not be shown, or the daemon that showed it is gone.
        std::function<void(int64_t id)> lost;
        std::function<void(int64_t id)> tapped;
        std::function<void(int64_t id, bool by_user)> closed;
    };

    Display(GDBusConnection *bus, Listener listener);
    ~Display();
    Display(const Display &) = delete;
    Display &operator=(const Display &) = delete;

    // Remembers what an earlier run of the panel showed.
    void remember(int64_t id, const DesktopId &shown);
    // Shows something new; starts the notification daemon if need be.
    void show(int64_t id);
    // The same place on the desktop now belongs to another notification.
    void replace(int64_t old_id, int64_t new_id);
    // The content changed.
    void change(int64_t id);
    // Shows it when it is not on the desktop.
    void ensureShown(int64_t id);
    void hide(int64_t id);
    void toast(const std::string &app, const std::string &message);

    // A notification changes at most ten times a second on the desktop.
    static constexpr int minimumIntervalMs = 100;

private:
    struct Entry;
    using EntryPtr = std::shared_ptr<Entry>;

    EntryPtr entryOf(int64_t id);
    EntryPtr entryShownAs(uint32_t number) const;
    void schedule(const EntryPtr &entry);
    void send(const EntryPtr &entry);
    void sent(const EntryPtr &entry, uint32_t number);
    void daemonAppeared();
    void daemonVanished();
    static gboolean onTimer(gpointer entry);
    static void stopTimer(Entry &entry);

    Listener listener_;
    std::map<int64_t, EntryPtr> entries_;
    bool knowsDaemon_ = false; // whether it is there was found out
    Desktop desktop_;
};

} // namespace pelliko::quickpanel
