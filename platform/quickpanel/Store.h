// The panel's record on disk: what is posted, where it is shown, what happened.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "Event.h"

namespace pelliko::quickpanel
{

// Under which number the desktop's notification daemon shows something.
struct DesktopId {
    uint32_t number = 0; // 0: not shown
    std::string owner;   // the daemon's unique bus name; numbers mean nothing to another one
};

// Each changing function is one transaction, on disk when it returns, and completes the event that
// it writes into the history. Throws std::exception when the disk refuses; nothing has changed
// then.
class Store
{
public:
    // A file that is no readable store is moved aside (".broken") and a new one begun.
    explicit Store(const std::string &path);
    ~Store();
    Store(const Store &) = delete;
    Store &operator=(const Store &) = delete;

    std::optional<Record> find(int64_t id) const;
    std::optional<Record> findByTag(const std::string &app, const std::string &tag) const;
    // Who posted it, and what carries a tag, without reading the content.
    std::optional<std::string> posterOf(int64_t id) const;
    std::optional<int64_t> idOfTag(const std::string &app, const std::string &tag) const;
    // Oldest first; of all applications when app is empty.
    std::vector<Record> list(const std::string &app) const;
    std::vector<Variant> history() const;

    // Gives the event's record a new id, never used before, and removes event.replaced.
    void post(Event &event);
    // A change of what goes on may be lost in a power cut, not when the panel is killed.
    void update(Event &event);
    // Removes the event's record.
    void remove(Event &event);
    void removeAll(std::vector<Event> &events);
    void append(Event &event);
    // Removes without a trace in the history.
    void forget(int64_t id);

    DesktopId desktopId(int64_t id) const;
    void setDesktopId(int64_t id, const DesktopId &shown);

    static constexpr int historyLength = 2000;

private:
    class Database;
    std::unique_ptr<Database> database_;
};

} // namespace pelliko::quickpanel
