#include "Modems.h"

#include "AccountSim.h"
#include "ModemManagerService.h"
#include "OfonoService.h"
#include "SystemBus.h"

#include <algorithm>

namespace pelliko::modem
{

namespace
{

ModemList accountStandIn()
{
    const std::string imsi = accountImsi();
    if (imsi.empty())
        return {};
    return {{Modem{"account", SimState::Ready, imsi, 0}}, 0, {}};
}

} // namespace

std::vector<std::unique_ptr<ModemService>> knownServices()
{
    std::vector<std::unique_ptr<ModemService>> services;
    services.push_back(std::make_unique<ModemManagerService>());
    services.push_back(makeOfonoService());
    return services;
}

ModemList currentModems()
{
    std::string error;
    for (const auto &service : knownServices()) {
        const std::optional<ModemList> list = service->read();
        if (list && !list->modems.empty())
            return *list;
        if (list && error.empty())
            error = list->error;
    }
    // A service that does not answer may have a modem: then nothing stands in for it.
    return error.empty() ? accountStandIn() : ModemList{{}, -1, error};
}

bool anySimReady(const ModemList &list)
{
    return std::any_of(list.modems.begin(), list.modems.end(),
                       [](const Modem &modem) { return modem.sim == SimState::Ready; });
}

bool mayHaveModem()
{
    for (const auto &service : knownServices()) {
        startOnSystemBus(service->busName());
        const std::optional<ModemList> list = service->read();
        if (list && (!list->modems.empty() || !list->error.empty()))
            return true;
    }
    return false;
}

std::optional<std::string> sendThroughModem(int slot, const std::string &to,
                                            const std::string &text)
{
    std::string error;
    for (const auto &service : knownServices()) {
        startOnSystemBus(service->busName());
        const std::optional<ModemList> list = service->read();
        if (list && !list->modems.empty())
            return service->sendSms(slot, to, text);
        if (list && error.empty())
            error = list->error;
    }
    return error.empty() ? std::nullopt : std::optional(error);
}

} // namespace pelliko::modem
