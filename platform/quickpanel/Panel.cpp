#include "Panel.h"

#include <algorithm>

#include "Launch.h"
#include "notification.h"

namespace pelliko::quickpanel
{
namespace
{

bool isKnownType(const Record &record)
{
    return record.type == NOTIFICATION_TYPE_NOTI || record.type == NOTIFICATION_TYPE_ONGOING;
}

Event eventOf(const char *name, Record record)
{
    Event event;
    event.name = name;
    event.record = std::move(record);
    return event;
}

// The disk may refuse while the daemon reports something; that must not end the panel.
template <typename Call> void survive(const Call &call)
{
    try {
        call();
    } catch (const std::exception &error) {
        g_printerr("quickpanel: the store refused a change: %s\n", error.what());
    }
}

} // namespace

Panel::Panel(Store &store, GDBusConnection *bus, std::function<void(const Event &)> happened)
    : store_(store), bus_(bus), happened_(std::move(happened)), display_(bus, displayListener())
{
    restore();
}

Display::Listener Panel::displayListener()
{
    Display::Listener listener;
    listener.content = [this](int64_t id) { return store_.find(id); };
    listener.refill = [this] { refill(); };
    listener.shownAs = [this](int64_t id, const DesktopId &shown) {
        survive([&] { store_.setDesktopId(id, shown); });
    };
    listener.lost = [this](int64_t id) { dropTicker(id); };
    listener.tapped = [this](int64_t id) { survive([&] { tap(id); }); };
    listener.closed = [this](int64_t id, bool by_user) {
        survive([&] { closedByDesktop(id, by_user); });
    };
    return listener;
}

// Tickers of an earlier run have had their moment.
void Panel::restore()
{
    for (const Record &record : store_.list("")) {
        if (record.isTicker())
            store_.forget(record.id);
        else if (isShown(record))
            display_.remember(record.id, store_.desktopId(record.id));
    }
}

void Panel::refill()
{
    for (const Record &record : store_.list(""))
        if (record.isInTray())
            display_.ensureShown(record.id);
}

int Panel::post(const std::string &app, int64_t previous, Record record, int64_t *id)
{
    if (!isKnownType(record))
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    if (previous != 0 && store_.posterOf(previous) == app)
        return NOTIFICATION_ERROR_ALREADY_EXIST_ID;
    record.app = app;
    Event event = eventOf(record.isTicker() ? "ticker" : "post", std::move(record));
    if (!event.record.tag.empty()) {
        event.replaced = store_.idOfTag(app, event.record.tag).value_or(0);
    }
    store_.post(event);
    *id = event.record.id;
    happened_(event);
    show(event.replaced, event.record);
    return NOTIFICATION_ERROR_NONE;
}

void Panel::show(int64_t replaced, const Record &record)
{
    if (!isShown(record))
        display_.hide(replaced);
    else if (replaced != 0)
        display_.replace(replaced, record.id);
    else
        display_.show(record.id);
}

int Panel::update(const std::string &app, int64_t id, Record record)
{
    if (store_.posterOf(id) != app)
        return NOTIFICATION_ERROR_NOT_EXIST_ID;
    if (!isKnownType(record))
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    if (!record.tag.empty()) {
        if (store_.idOfTag(app, record.tag).value_or(id) != id)
            return NOTIFICATION_ERROR_ALREADY_EXIST_ID;
    }
    record.id = id;
    record.app = app;
    Event event = eventOf("update", std::move(record));
    store_.update(event);
    happened_(event);
    if (isShown(event.record))
        display_.change(id);
    else
        display_.hide(id);
    return NOTIFICATION_ERROR_NONE;
}

int Panel::remove(const std::string &app, int64_t id)
{
    const auto posted = store_.find(id);
    if (!posted || posted->app != app)
        return NOTIFICATION_ERROR_NOT_EXIST_ID;
    takeAway("delete", *posted);
    return NOTIFICATION_ERROR_NONE;
}

int Panel::removeAll(const std::string &app, int type)
{
    std::vector<Event> events;
    for (const Record &record : store_.list(app))
        if (type == NOTIFICATION_TYPE_NONE || record.type == type)
            events.push_back(eventOf("delete", record));
    store_.removeAll(events);
    for (const Event &event : events) {
        happened_(event);
        display_.hide(event.record.id);
    }
    return NOTIFICATION_ERROR_NONE;
}

int Panel::load(const std::string &app, const std::string &tag, Record *record) const
{
    const auto posted = tag.empty() ? std::nullopt : store_.findByTag(app, tag);
    if (!posted)
        return NOTIFICATION_ERROR_NOT_EXIST_ID;
    *record = *posted;
    return NOTIFICATION_ERROR_NONE;
}

int Panel::toast(const std::string &app, const std::string &message)
{
    Event event;
    event.name = "toast";
    event.record.app = app;
    event.message = message;
    store_.append(event);
    happened_(event);
    display_.toast(app, message);
    return NOTIFICATION_ERROR_NONE;
}

int Panel::tap(int64_t id)
{
    const auto posted = store_.find(id);
    if (!posted)
        return NOTIFICATION_ERROR_NOT_EXIST_ID;
    // Sent first: when the panel is killed in between, a tap is repeated rather than lost.
    launch(bus_, *posted);
    if (!posted->isOngoing()) {
        takeAway("tap", *posted);
        return NOTIFICATION_ERROR_NONE;
    }
    Event event = eventOf("tap", *posted);
    store_.append(event);
    happened_(event);
    return NOTIFICATION_ERROR_NONE;
}

int Panel::swipe(int64_t id)
{
    const auto posted = store_.find(id);
    if (!posted)
        return NOTIFICATION_ERROR_NOT_EXIST_ID;
    if (posted->isOngoing())
        return TIZEN_ERROR_NOT_PERMITTED;
    takeAway("swipe", *posted);
    return NOTIFICATION_ERROR_NONE;
}

void Panel::closedByDesktop(int64_t id, bool by_user)
{
    const auto posted = store_.find(id);
    if (!posted)
        return;
    if (posted->isTicker())
        dropTicker(id);
    else if (posted->isOngoing())
        display_.ensureShown(id);
    else if (by_user)
        takeAway("swipe", *posted);
}

void Panel::takeAway(const char *event_name, const Record &record)
{
    Event event = eventOf(event_name, record);
    store_.remove(event);
    happened_(event);
    display_.hide(record.id);
}

void Panel::dropTicker(int64_t id)
{
    survive([&] {
        const auto posted = store_.find(id);
        if (!posted || !posted->isTicker())
            return;
        store_.forget(id);
        display_.hide(id);
    });
}

std::vector<Record> Panel::list(const std::string &app) const
{
    std::vector<Record> records = store_.list(app);
    records.erase(std::remove_if(records.begin(), records.end(),
                                 [](const Record &record) { return record.isTicker(); }),
                  records.end());
    return records;
}

} // namespace pelliko::quickpanel
