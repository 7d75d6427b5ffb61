// The platform log.
#pragma once

#include <stdarg.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef enum {
    DLOG_UNKNOWN = 0,
    DLOG_DEFAULT, /* 1 */
    DLOG_VERBOSE, /* 2 */
    DLOG_DEBUG,   /* 3 */
    DLOG_INFO,    /* 4 */
    DLOG_WARN,    /* 5 */
    DLOG_ERROR,   /* 6 */
    DLOG_FATAL,   /* 7 */
    DLOG_SILENT,  /* 8 */
    DLOG_PRIO_MAX
} log_priority;

typedef enum {
    DLOG_ERROR_NONE = 0,
    DLOG_ERROR_NOT_PERMITTED = -1,
    DLOG_ERROR_INVALID_PARAMETER = -22
} dlog_error_e;

/// Writes one line. Any thread; takes no lock of the caller's and leaves errno alone.
/// Returns the number of bytes of the formatted text (0 for DLOG_SILENT) or a negative
/// dlog_error_e.
int dlog_print(log_priority prio, const char *tag, const char *fmt, ...)
    __attribute__((format(printf, 3, 4)));

/// The same with an argument list.
int dlog_vprint(log_priority prio, const char *tag, const char *fmt, va_list ap)
    __attribute__((format(printf, 3, 0)));

#ifdef __cplusplus
}
#endif
