// Tells when modems, their SIMs or the modem services themselves change.
#pragma once

#include "ModemService.h"

#include <functional>
#include <memory>

namespace pelliko::modem
{

/// Made, used and destroyed on the main loop. A service that is installed but not running is
/// started in the background.
class ModemWatch
{
public:
    /// `changed` is called on the main loop with what the machine has now, after every change that
    /// may matter; it may be called without a difference. The services are asked on another thread,
    /// so a service that hangs does not hold up the loop.
    explicit ModemWatch(std::function<void(const ModemList &)> changed);
    ~ModemWatch();
    ModemWatch(const ModemWatch &) = delete;
    ModemWatch &operator=(const ModemWatch &) = delete;

private:
    struct Impl;
    std::shared_ptr<Impl> impl_;
};

} // namespace pelliko::modem
