/* Telephony: the modems of the machine by name, and a handle for each. Main loop only. */
#ifndef PELLIKO_TAPI_COMMON_H
#define PELLIKO_TAPI_COMMON_H

#ifdef __cplusplus
extern "C" {
#endif

typedef struct tapi_handle TapiHandle;

/* Results: zero for success, negative for an error. */
#define TAPI_API_SUCCESS 0
#define TAPI_API_INVALID_PTR (-2)
#define TAPI_API_OPERATION_FAILED (-5)
#define TAPI_API_SIM_NOT_FOUND (-9)
#define TAPI_API_SIM_LOCKED (-10)

/** The names of the modems in slot order, ended by a null pointer, for g_strfreev; NULL when there
 * is none. */
char **tel_get_cp_name_list(void);

/** A handle of the modem with this name (null: the first modem), for tel_deinit; NULL when there is
 * no such modem. */
TapiHandle *tel_init(const char *cp_name);

/** Releases a handle. TAPI_API_INVALID_PTR for a null handle. */
int tel_deinit(TapiHandle *handle);

#ifdef __cplusplus
}
#endif

#endif
