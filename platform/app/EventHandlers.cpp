#include "Frame.h"

#include "Guard.h"

#include <vconf.h>

#include <algorithm>
#include <memory>
#include <vector>

struct app_event_handler {
    app_event_type_e type;
    app_event_cb callback;
    void *userData;
};

struct app_event_info {
    app_event_type_e type;
};

namespace
{

using Handler = std::shared_ptr<app_event_handler>;

std::vector<Handler> handlers;

void raiseLanguageChanged(keynode_t *, void *)
{
    app_event_info event{APP_EVENT_LANGUAGE_CHANGED};
    // A handler may remove itself or another one.
    const std::vector<Handler> called = handlers;
    for (const Handler &handler : called) {
        const bool registered =
            std::find(handlers.begin(), handlers.end(), handler) != handlers.end();
        if (registered && handler->type == event.type)
            handler->callback(&event, handler->userData);
    }
}

} // namespace

namespace pelliko::platform
{

void watchLanguage()
{
    vconf_notify_key_changed(VCONFKEY_LANGSET, raiseLanguageChanged, nullptr);
}

void unwatchLanguage()
{
    vconf_ignore_key_changed(VCONFKEY_LANGSET, raiseLanguageChanged);
}

} // namespace pelliko::platform

int ui_app_add_event_handler(app_event_handler_h *handler, app_event_type_e event_type,
                             app_event_cb callback, void *user_data)
{
    if (!handler || !callback || event_type < APP_EVENT_LOW_MEMORY ||
        event_type > APP_EVENT_REGION_FORMAT_CHANGED)
        return APP_ERROR_INVALID_PARAMETER;
    return pelliko::platform::guarded([=] {
        handlers.push_back(std::make_shared<app_event_handler>(
            app_event_handler{event_type, callback, user_data}));
        *handler = handlers.back().get();
        return APP_ERROR_NONE;
    });
}

int ui_app_remove_event_handler(app_event_handler_h handler)
{
    const auto found = std::find_if(handlers.begin(), handlers.end(),
                                    [=](const Handler &known) { return known.get() == handler; });
    if (found == handlers.end())
        return APP_ERROR_INVALID_PARAMETER;
    handlers.erase(found);
    return APP_ERROR_NONE;
}
