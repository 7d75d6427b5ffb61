#include "kor_account.h"
#include "kor_sim.h"

#include <ITapiSim.h>
#include <glib.h>
#include <tapi_common.h>

#include <cstring>

namespace pelliko::korrin
{
namespace
{

// The platform's name of the modem that an account stands in for: no SIM of the machine's own.
constexpr const char *accountModem = "account";

std::string imsiOf(const char *modem)
{
    TapiHandle *handle = tel_init(modem);
    TelSimImsiInfo_t parts{};
    std::string imsi;
    if (tel_get_sim_imsi(handle, &parts) == TAPI_API_SUCCESS)
        imsi = std::string(parts.szMcc) + parts.szMnc + parts.szMsin;
    tel_deinit(handle);
    return isImsi(imsi) ? imsi : std::string();
}

} // namespace

std::string machineImsi()
{
    char **names = tel_get_cp_name_list();
    std::string imsi;
    for (char **name = names; name && *name && imsi.empty(); ++name) {
        if (std::strcmp(*name, accountModem) != 0)
            imsi = imsiOf(*name);
    }
    g_strfreev(names);
    return imsi;
}

} // namespace pelliko::korrin
