/* Telephony: which SIM carries the data connection. Main loop only. */
#ifndef PELLIKO_ITAPI_NETWORK_H
#define PELLIKO_ITAPI_NETWORK_H

#include "tapi_common.h"

#ifdef __cplusplus
extern "C" {
#endif

typedef enum {
    TAPI_NETWORK_DEFAULT_DATA_SUBS_UNKNOWN = -1,
    TAPI_NETWORK_DEFAULT_DATA_SUBS_SIM1 = 0,
    TAPI_NETWORK_DEFAULT_DATA_SUBS_SIM2 = 1
} TelNetworkDefaultDataSubs_t;

/** Writes the slot of the data SIM. An error, and the output left alone, when it is not known. */
int tel_get_network_default_data_subscription(TapiHandle *handle,
                                              TelNetworkDefaultDataSubs_t *default_subscription);

#ifdef __cplusplus
}
#endif

#endif
