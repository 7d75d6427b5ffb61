#ifndef KOR_CLIENT_H
#define KOR_CLIENT_H

/**
 * The account client: tells whether the user has an account at a share server and which SIM it
 * belongs to.
 *
 * All functions are synchronous and belong to the thread of the main loop. Each returns 0 or a
 * negative error code; on an error the out-parameters are left untouched.
 */

#ifdef __cplusplus
extern "C" {
#endif

#define KOR_ERROR_NONE 0
/** The account's file cannot be read, or holds something else than an account. */
#define KOR_ERROR_IO_ERROR (-5)
#define KOR_ERROR_OUT_OF_MEMORY (-12)
/** A null handle, a null out-parameter, or a text that is no IMSI. */
#define KOR_ERROR_INVALID_PARAMETER (-22)
/** There is no account to say it of. */
#define KOR_ERROR_NO_ACCOUNT (-61)

typedef struct kor_handle_s *kor_handle_h;

/** Opens the client. Every call gives a handle of its own, which lives as long as the process. */
int kor_open_handle(kor_handle_h *handle);

/**
 * Looks whether there is an account.
 * @param imsi  gets the IMSI of the account's SIM, to be released with free(), or NULL when there
 *              is no account
 * @param state gets 1 when there is an account, else 0; may be NULL
 */
int kor_check_account_exist(kor_handle_h handle, char **imsi, int *state);

/** Notes which SIM the account belongs to: 6 to 15 digits. It is on the disk on return. */
int kor_set_imsi(kor_handle_h handle, const char *imsi);

#ifdef __cplusplus
}
#endif

#endif
