// The panel on the session bus.
#pragma once

#include <memory>
#include <string>

#include <gio/gio.h>

#include "Store.h"

namespace pelliko::quickpanel
{

class BusObject
{
public:
    static constexpr const char *busName = "com.velmora.quickpanel";

    // Exports the object. Calls are answered by the main loop only, so the first one finds a
    // started panel. Throws std::runtime_error when the object cannot be exported.
    explicit BusObject(GDBusConnection *bus);
    ~BusObject();
    BusObject(const BusObject &) = delete;
    BusObject &operator=(const BusObject &) = delete;

    // What is posted is shown from now on. To be called before the main loop runs.
    void start(Store &store);

private:
    struct Impl;
    std::unique_ptr<Impl> impl_;
};

} // namespace pelliko::quickpanel
