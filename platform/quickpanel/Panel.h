// The rules: what posting, changing, deleting, tapping and swiping mean.
#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "Display.h"
#include "Store.h"

namespace pelliko::quickpanel
{

// Main loop only. Results are 0 or notification error numbers; std::exception when the disk
// refuses.
class Panel
{
public:
    // happened: called for every event after it is on disk.
    Panel(Store &store, GDBusConnection *bus, std::function<void(const Event &)> happened);

    // On success the private id is written to *id.
    int post(const std::string &app, int64_t previous, Record record, int64_t *id);
    int update(const std::string &app, int64_t id, Record record);
    int remove(const std::string &app, int64_t id);
    int removeAll(const std::string &app, int type);
    int load(const std::string &app, const std::string &tag, Record *record) const;
    int toast(const std::string &app, const std::string &message);
    int tap(int64_t id);
    int swipe(int64_t id);

    // Without tickers, which are never in the tray.
    std::vector<Record> list(const std::string &app) const;
    std::vector<Variant> history() const { return store_.history(); }

private:
    Display::Listener displayListener();
    void restore();
    void refill();
    void show(int64_t replaced, const Record &record);
    void closedByDesktop(int64_t id, bool by_user);
    void takeAway(const char *event_name, const Record &record);
    void dropTicker(int64_t id);

    Store &store_;
    GDBusConnection *bus_;
    std::function<void(const Event &)> happened_;
    Display display_;
};

} // namespace pelliko::quickpanel
