#include "Display.h"

#include <vector>

namespace pelliko::quickpanel
{

struct Display::Entry {
    Display *display;
    int64_t id;
    DesktopId shown{};
    bool inFlight = false; // a Notify call is on its way
    bool changed = false;  // since that call
    bool hidden = false;   // taken away while it was on its way
    gint64 lastSent = 0;   // monotonic microseconds
    guint timer = 0;
};

Display::Display(GDBusConnection *bus, Listener listener)
    : listener_(std::move(listener)),
      desktop_(bus, Desktop::Listener{[this] { daemonAppeared(); }, [this] { daemonVanished(); },
                                      [this](uint32_t number) {
                                          if (const auto entry = entryShownAs(number))
                                              listener_.tapped(entry->id);
                                      },
                                      [this](uint32_t number, bool by_user) {
                                          const auto entry = entryShownAs(number);
                                          if (!entry)
                                              return;
                                          entry->shown = {};
                                          listener_.closed(entry->id, by_user);
                                      }})
{
}

Display::~Display()
{
    for (const auto &[id, entry] : entries_)
        stopTimer(*entry);
}

void Display::remember(int64_t id, const DesktopId &shown)
{
    entryOf(id)->shown = shown;
}

void Display::show(int64_t id)
{
    schedule(entryOf(id));
}

void Display::replace(int64_t old_id, int64_t new_id)
{
    const auto found = entries_.find(old_id);
    if (found != entries_.end()) {
        const EntryPtr entry = found->second;
        entries_.erase(found);
        entry->id = new_id;
        entries_[new_id] = entry;
    }
    show(new_id);
}

// Without a daemon the newest content is shown when one appears; a change starts none.
void Display::change(int64_t id)
{
    const EntryPtr entry = entryOf(id);
    if (desktop_.isPresent() || entry->inFlight)
        schedule(entry);
}

void Display::ensureShown(int64_t id)
{
    const EntryPtr entry = entryOf(id);
    if (!entry->inFlight && desktop_.isPresent())
        schedule(entry);
}

void Display::hide(int64_t id)
{
    const auto found = entries_.find(id);
    if (found == entries_.end())
        return;
    const EntryPtr entry = found->second;
    entries_.erase(found);
    stopTimer(*entry);
    entry->hidden = true;
    if (entry->shown.number != 0)
        desktop_.close(entry->shown.number);
}

void Display::toast(const std::string &app, const std::string &message)
{
    desktop_.show(toastOf(app, message), 0, [](uint32_t) {});
}

Display::EntryPtr Display::entryOf(int64_t id)
{
    auto &slot = entries_[id];
    if (!slot)
        slot = std::make_shared<Entry>(Entry{this, id});
    return slot;
}

Display::EntryPtr Display::entryShownAs(uint32_t number) const
{
    for (const auto &[id, entry] : entries_)
        if (entry->shown.number == number)
            return entry;
    return nullptr;
}

// A running timer or call will bring the newest content by itself.
void Display::schedule(const EntryPtr &entry)
{
    if (entry->inFlight) {
        entry->changed = true;
        return;
    }
    if (entry->timer != 0)
        return;
    const gint64 elapsedMs = (g_get_monotonic_time() - entry->lastSent) / 1000;
    if (entry->lastSent == 0 || elapsedMs >= minimumIntervalMs)
        send(entry);
    else
        entry->timer =
            g_timeout_add(static_cast<guint>(minimumIntervalMs - elapsedMs), onTimer, entry.get());
}

gboolean Display::onTimer(gpointer data)
{
    auto *entry = static_cast<Entry *>(data);
    entry->timer = 0;
    entry->display->send(entry->display->entryOf(entry->id));
    return G_SOURCE_REMOVE;
}

void Display::stopTimer(Entry &entry)
{
    if (entry.timer != 0)
        g_source_remove(entry.timer);
    entry.timer = 0;
}

void Display::send(const EntryPtr &entry)
{
    const auto record = listener_.content(entry->id);
    if (!record)
        return;
    entry->inFlight = true;
    entry->lastSent = g_get_monotonic_time();
    desktop_.show(presentationOf(*record), entry->shown.number,
                  [this, entry](uint32_t number) { sent(entry, number); });
}

void Display::sent(const EntryPtr &entry, uint32_t number)
{
    entry->inFlight = false;
    if (entry->hidden) {
        if (number != 0)
            desktop_.close(number);
        return;
    }
    const bool changed = std::exchange(entry->changed, false);
    if (number == 0) {
        entry->shown = {};
        listener_.lost(entry->id);
        return;
    }
    const bool moved = entry->shown.number != number || entry->shown.owner != desktop_.owner();
    entry->shown = {number, desktop_.owner()};
    if (moved)
        listener_.shownAs(entry->id, entry->shown);
    if (changed)
        schedule(entry);
}

void Display::daemonAppeared()
{
    knowsDaemon_ = true;
    for (const auto &[id, entry] : entries_)
        if (entry->shown.owner != desktop_.owner())
            entry->shown = {};
    listener_.refill();
}

void Display::daemonVanished()
{
    const bool first = !std::exchange(knowsDaemon_, true);
    std::vector<int64_t> ids;
    for (const auto &[id, entry] : entries_) {
        entry->shown = {};
        stopTimer(*entry);
        if (!entry->inFlight)
            ids.push_back(id);
    }
    // At the panel's start what is posted is reason enough to start a daemon; after one went it is
    // not.
    for (const int64_t id : ids) {
        if (first)
            show(id);
        else
            listener_.lost(id);
    }
}

} // namespace pelliko::quickpanel
