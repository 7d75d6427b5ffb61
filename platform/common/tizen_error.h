// The error numbers that all platform interfaces share: generic ones are negated errno values,
// a module's own errors are its negative base combined with a small number.
#pragma once

#include <stdarg.h>
#include <stdbool.h>
#include <stddef.h>
#include <stdint.h>
#include <time.h>

#define TIZEN_ERROR_NONE 0
#define TIZEN_ERROR_NOT_PERMITTED (-1)
#define TIZEN_ERROR_NO_SUCH_FILE (-2)
#define TIZEN_ERROR_IO_ERROR (-5)
#define TIZEN_ERROR_OUT_OF_MEMORY (-12)
#define TIZEN_ERROR_PERMISSION_DENIED (-13)
#define TIZEN_ERROR_INVALID_PARAMETER (-22)
#define TIZEN_ERROR_FILE_NO_SPACE_ON_DEVICE (-28)
#define TIZEN_ERROR_NO_DATA (-61)
#define TIZEN_ERROR_TIMED_OUT (-1073741823)
#define TIZEN_ERROR_NOT_SUPPORTED (-1073741822)
#define TIZEN_ERROR_KEY_NOT_AVAILABLE (-126)
#define TIZEN_ERROR_KEY_REJECTED (-129)
#define TIZEN_ERROR_APPLICATION (-0x01100000)
#define TIZEN_ERROR_NOTIFICATION (-0x01140000)
#define TIZEN_ERROR_BUNDLE (-0x01180000)
#define TIZEN_ERROR_CONTACTS (-0x02010000)
#define TIZEN_ERROR_EFL_UTIL (-0x02860000)

#ifdef __cplusplus
extern "C" {
#endif

/// A readable sentence for any error number. Static text, never NULL; the caller does not free it.
char *get_error_message(int err_code);

/// The code left by this thread's last call of a function that returns a handle (0 at first).
int get_last_result(void);

/// Leaves a code for get_last_result on this thread.
void set_last_result(int err_code);

#ifdef __cplusplus
}
#endif
