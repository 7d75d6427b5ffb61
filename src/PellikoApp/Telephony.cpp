#include "PellikoApp/Telephony.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/CountryCodes.h"

#include <ITapiNetwork.h>
#include <ITapiSim.h>
#include <glib.h>
#include <optional>
#include <tapi_common.h>
#include <vconf-keys.h>

namespace pelliko
{

namespace
{

constexpr size_t maxModems = 3; ///< the record keeps one place for the end

// The output has the size of its enumeration, which need not be that of int.
std::optional<int> _dataSlot(const PellikoAppData *ad)
{
    TelNetworkDefaultDataSubs_t slot = TAPI_NETWORK_DEFAULT_DATA_SUBS_SIM1;
    const int ret = tel_get_network_default_data_subscription(ad->tapi_handle[0], &slot);
    if (ret == TAPI_API_SUCCESS)
        return slot;
    LOG_ERROR("tel_get_network_default_data_subscription is failed, err_code is %d", ret);
    return std::nullopt;
}

void _findCcc(PellikoAppData *ad, int index)
{
    const int ret = _getCcc(ad, index);
    if (ret < 0)
        LOG_ERROR("_getCcc() failed !! ret = %d", ret);
}

void _openTelephony(PellikoAppData *ad)
{
    _initializeTelephony(ad);
    const std::optional<int> slot = _dataSlot(ad);
    if (slot) {
        LOG_DEBUG("SIM index = %d", *slot);
        ad->sim_index = *slot;
    }
    _findCcc(ad, slot.value_or(0));
}

void _closeTelephony(PellikoAppData *ad)
{
    for (TapiHandle *&handle : ad->tapi_handle) {
        if (handle)
            tel_deinit(handle);
        handle = nullptr;
    }
    g_strfreev(ad->cp_name_list);
    ad->cp_name_list = nullptr;
}

} // namespace

void startTelephony(PellikoAppData *ad)
{
    ad->sim_index = 0;
    int ready = 0;
    vconf_get_bool(VCONFKEY_TELEPHONY_READY, &ready);
    if (ready == 1) {
        _openTelephony(ad);
        return;
    }
    LOG_DEBUG("tapi_ready_state isn't yet ready !!");
    if (vconf_notify_key_changed(VCONFKEY_TELEPHONY_READY, _telReadyCb, ad) < 0)
        LOG_ERROR("vconf_notify_key_changed VCONFKEY_TELEPHONY_READY is failed!! ");
}

void _initializeTelephony(PellikoAppData *ad)
{
    RETURN_IF_NULL(ad, "Data is NULL");
    if (!ad->cp_name_list)
        ad->cp_name_list = tel_get_cp_name_list();
    if (!ad->cp_name_list) {
        LOG_ERROR("Dual-sim - Could not get the cp_name_list");
        return;
    }
    size_t i = 0;
    for (; i < maxModems && ad->cp_name_list[i]; ++i) {
        if (ad->tapi_handle[i])
            LOG_DEBUG("%d tapi_handle is already initialized.", static_cast<int>(i));
        else
            ad->tapi_handle[i] = tel_init(ad->cp_name_list[i]);
    }
    ad->tapi_handle[i] = nullptr;
}

int _getCcc(PellikoAppData *ad, int index)
{
    RETURN_VALUE_IF_NULL(ad, -1, "Data is NULL");
    RETURN_VALUE_IF(index < 0 || index >= TAPI_HANDLE_MAX, -1, "invalid index = %d", index);
    if (ad->sender_ccc) {
        LOG_DEBUG("sender_ccc already exist !!");
        return 0;
    }
    TapiHandle *handle = ad->tapi_handle[index];
    RETURN_VALUE_IF_NULL(handle, -1, "Tapi handle is NULL");
    TelSimImsiInfo_t imsi = {};
    const int ret = tel_get_sim_imsi(handle, &imsi);
    if (ret != TAPI_API_SUCCESS) {
        LOG_ERROR("tel_get_sim_imsi error (SIM might be missing)= %d", ret);
        return -1;
    }
    const char *country = countryOfMobileCode(imsi.szMcc);
    if (!country) {
        LOG_ERROR("account_country_code is NULL !!");
        return 0;
    }
    ad->sender_ccc = g_strdup(callingCodeOfCountry(country));
    return 0;
}

void _telReadyCb(keynode_t *key, void *data)
{
    auto *ad = static_cast<PellikoAppData *>(data);
    RETURN_IF_NULL(ad, "data is NULL.");
    const int status = vconf_keynode_get_bool(key);
    LOG_DEBUG("tel status[%d]", status);
    if (status != 1) {
        _closeTelephony(ad);
        return;
    }
    _initializeTelephony(ad);
    const std::optional<int> slot = _dataSlot(ad);
    if (slot)
        LOG_DEBUG("index = %d", *slot);
    _findCcc(ad, slot.value_or(0));
}

} // namespace pelliko
