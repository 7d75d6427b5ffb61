/* Telephony: what the SIM of a modem says. Main loop only. */
#ifndef PELLIKO_ITAPI_SIM_H
#define PELLIKO_ITAPI_SIM_H

#include "tapi_common.h"

#ifdef __cplusplus
extern "C" {
#endif

#define TAPI_SIM_MCC_CODE_LEN 3
#define TAPI_SIM_MNC_CODE_LEN 3
#define TAPI_SIM_MSIN_CODE_LEN 10

/** The three parts of a subscriber's number: country, network, subscriber. Digits, always
 * terminated. */
typedef struct {
    char szMcc[TAPI_SIM_MCC_CODE_LEN + 1];
    char szMnc[TAPI_SIM_MNC_CODE_LEN + 1];
    char szMsin[TAPI_SIM_MSIN_CODE_LEN + 1];
} TelSimImsiInfo_t;

/**
 * Asks the modem service and fills `imsi`. An error leaves it alone: no SIM, a locked one, a number
 * that is none (other characters than digits, or too short to hold a country and a network), a
 * modem that is gone.
 */
int tel_get_sim_imsi(TapiHandle *handle, TelSimImsiInfo_t *imsi);

#ifdef __cplusplus
}
#endif

#endif
