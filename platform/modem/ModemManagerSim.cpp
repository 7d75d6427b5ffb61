#include "ModemManagerSim.h"

#include <cstring>

namespace pelliko::modem
{
namespace
{

constexpr int mccLength = 3;

std::string textOf(const gchar *text)
{
    return text ? text : "";
}

// A failed modem has no states of its own any more, only the reason.
SimState afterFailure(MMModemStateFailedReason reason)
{
    switch (reason) {
    case MM_MODEM_STATE_FAILED_REASON_SIM_MISSING:
    case MM_MODEM_STATE_FAILED_REASON_ESIM_WITHOUT_PROFILES:
        return SimState::Missing;
    case MM_MODEM_STATE_FAILED_REASON_SIM_ERROR:
        return SimState::Locked;
    default:
        return SimState::Unknown;
    }
}

SimState afterLock(MMModemLock lock)
{
    switch (lock) {
    case MM_MODEM_LOCK_UNKNOWN:
        return SimState::Unknown;
    case MM_MODEM_LOCK_NONE:
    // The second PIN guards only a few services of the SIM, none that is used here.
    case MM_MODEM_LOCK_SIM_PIN2:
    case MM_MODEM_LOCK_SIM_PUK2:
        return SimState::Ready;
    default:
        return SimState::Locked;
    }
}

bool hasSim(MMModem *modem)
{
    const gchar *path = mm_modem_get_sim_path(modem);
    return path && std::strcmp(path, "/") != 0;
}

// The operator's identifier is MCC and MNC, as long as this network writes them.
int mncLengthOf(const std::string &imsi, const std::string &identifier)
{
    const int length = static_cast<int>(identifier.size()) - mccLength;
    const bool fits = length == 2 || length == 3;
    return fits && imsi.compare(0, identifier.size(), identifier) == 0 ? length : 0;
}

} // namespace

SimState simAccess(MMModem *modem)
{
    const MMModemState state = mm_modem_get_state(modem);
    if (state == MM_MODEM_STATE_FAILED)
        return afterFailure(mm_modem_get_state_failed_reason(modem));
    const bool stillStarting =
        state == MM_MODEM_STATE_UNKNOWN || state == MM_MODEM_STATE_INITIALIZING;
    if (!hasSim(modem))
        return stillStarting ? SimState::Unknown : SimState::Missing;
    return afterLock(mm_modem_get_unlock_required(modem));
}

Modem describe(MMObject *object, GCancellable *cancellable)
{
    MMModem *modem = mm_object_peek_modem(object);
    Modem result{mm_object_get_path(object), simAccess(modem), {}, 0};
    if (result.sim != SimState::Ready)
        return result;
    g_autoptr(MMSim) sim = mm_modem_get_sim_sync(modem, cancellable, nullptr);
    if (sim) {
        result.imsi = textOf(mm_sim_get_imsi(sim));
        result.mncLength = mncLengthOf(result.imsi, textOf(mm_sim_get_operator_identifier(sim)));
    }
    if (result.imsi.empty())
        result.sim = SimState::Unknown;
    return result;
}

} // namespace pelliko::modem
