// The telephony interface over the modems of the machine.
#include "ITapiNetwork.h"
#include "ITapiSim.h"
#include "Imsi.h"
#include "tapi_common.h"

#include <Modems.h>

#include <algorithm>
#include <exception>
#include <glib.h>

using namespace pelliko::modem;

struct tapi_handle {
    std::string modem;
};

namespace
{

// No exception may reach a C caller; what can be thrown here is a lack of memory.
template <typename Result, typename Body> Result guarded(Result failure, const Body &body)
{
    try {
        return body();
    } catch (const std::exception &) {
        return failure;
    }
}

std::optional<Modem> findModem(const ModemList &list, const std::string &name)
{
    const auto found = std::find_if(list.modems.begin(), list.modems.end(),
                                    [&](const Modem &modem) { return modem.name == name; });
    return found == list.modems.end() ? std::nullopt : std::optional(*found);
}

char **namesOf(const ModemList &list)
{
    if (list.modems.empty())
        return nullptr;
    char **names = g_new0(char *, list.modems.size() + 1);
    for (std::size_t i = 0; i < list.modems.size(); ++i)
        names[i] = g_strdup(list.modems[i].name.c_str());
    return names;
}

int readImsi(const Modem &modem, TelSimImsiInfo_t &out)
{
    if (modem.sim == SimState::Missing)
        return TAPI_API_SIM_NOT_FOUND;
    if (modem.sim == SimState::Locked)
        return TAPI_API_SIM_LOCKED;
    const auto parts = pelliko::telephony::splitImsi(modem.imsi, modem.mncLength);
    if (modem.sim != SimState::Ready || !parts)
        return TAPI_API_OPERATION_FAILED;
    out = *parts;
    return TAPI_API_SUCCESS;
}

} // namespace

extern "C" {

char **tel_get_cp_name_list(void)
{
    return guarded<char **>(nullptr, [] { return namesOf(currentModems()); });
}

TapiHandle *tel_init(const char *cp_name)
{
    return guarded<TapiHandle *>(nullptr, [&]() -> TapiHandle * {
        const ModemList list = currentModems();
        if (list.modems.empty())
            return nullptr;
        const std::string name = cp_name ? cp_name : list.modems.front().name;
        return findModem(list, name) ? new TapiHandle{name} : nullptr;
    });
}

int tel_deinit(TapiHandle *handle)
{
    if (!handle)
        return TAPI_API_INVALID_PTR;
    delete handle;
    return TAPI_API_SUCCESS;
}

int tel_get_sim_imsi(TapiHandle *handle, TelSimImsiInfo_t *imsi)
{
    if (!handle || !imsi)
        return TAPI_API_INVALID_PTR;
    return guarded<int>(TAPI_API_OPERATION_FAILED, [&] {
        const std::optional<Modem> modem = findModem(currentModems(), handle->modem);
        return modem ? readImsi(*modem, *imsi) : TAPI_API_OPERATION_FAILED;
    });
}

int tel_get_network_default_data_subscription(TapiHandle *handle,
                                              TelNetworkDefaultDataSubs_t *default_subscription)
{
    if (!handle || !default_subscription)
        return TAPI_API_INVALID_PTR;
    return guarded<int>(TAPI_API_OPERATION_FAILED, [&] {
        const int slot = currentModems().dataModem;
        if (slot != TAPI_NETWORK_DEFAULT_DATA_SUBS_SIM1 &&
            slot != TAPI_NETWORK_DEFAULT_DATA_SUBS_SIM2)
            return TAPI_API_OPERATION_FAILED;
        *default_subscription = static_cast<TelNetworkDefaultDataSubs_t>(slot);
        return TAPI_API_SUCCESS;
    });
}
}
