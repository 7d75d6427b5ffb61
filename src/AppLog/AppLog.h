#pragma once

#include <cstdint>

// Every message of the application goes to two places in one call: the platform log (tag "PELLIKO")
// and a private rotating text file, so that the trace of a device can be collected afterwards.

namespace pelliko
{

/// Appends one line to the file log "/opt/usr/apps/com.velmora.pelliko/data/.app-logs/app.log":
/// local time, thread id, tag, source file, function, line, message. Any thread; lines never mix.
/// A file that reaches 5 MiB is packed into app.log.1.tar.gz (newest) to app.log.5.tar.gz and
/// emptied. Nothing is reported: a line that cannot be written is lost, and the directory is never
/// created.
/// @param file source file name without its directory
void appLogWrite(const char *file, const char *function, int line, const char *tag,
                 const char *format, ...) __attribute__((format(printf, 5, 6)));

enum class LogLevel { debug, error };

/// The function behind the macros below. An error carries "[ERROR]" in the platform log; the file
/// log gets the text as it stands.
void logMessage(LogLevel level, const char *file, const char *function, int line,
                const char *format, ...) __attribute__((format(printf, 5, 6)));

/// What a check prints for the value that it returns.
constexpr int checkedValue(int value)
{
    return value;
}
constexpr int checkedValue(decltype(nullptr))
{
    return 0;
}
inline int checkedValue(const void *value)
{
    return static_cast<int>(reinterpret_cast<intptr_t>(value));
}

/// A text for "%s" that is never a null pointer.
constexpr const char *textOrNull(const char *text)
{
    return text ? text : "(null)";
}

} // namespace pelliko

/// Trace line: LOG_DEBUG("count = %d", count);
#define LOG_DEBUG(...)                                                                             \
    ::pelliko::logMessage(::pelliko::LogLevel::debug, __FILE_NAME__, __func__, __LINE__,           \
                          __VA_ARGS__)

/// Error line: the same text, marked "[ERROR]" in the platform log.
#define LOG_ERROR(...)                                                                             \
    ::pelliko::logMessage(::pelliko::LogLevel::error, __FILE_NAME__, __func__, __LINE__,           \
                          __VA_ARGS__)

/// Leaves a function that has a result when `failed` holds; logs
/// "[ERROR][(failed)] Return value : value, message : " and the text.
#define RETURN_VALUE_IF(failed, value, format, ...)                                                \
    RETURN_VALUE_WITH_TEXT(failed, "(" #failed ")", value, format __VA_OPT__(, ) __VA_ARGS__)

/// Leaves a void function when `failed` holds; logs "[ERROR][(failed)] Return message : " and the
/// text.
#define RETURN_IF(failed, format, ...)                                                             \
    RETURN_WITH_TEXT(failed, "(" #failed ")", format __VA_OPT__(, ) __VA_ARGS__)

/// The same for a null pointer; the condition reads "(pointer == NULL)".
#define RETURN_VALUE_IF_NULL(pointer, value, format, ...)                                          \
    RETURN_VALUE_WITH_TEXT((pointer) == nullptr, "(" #pointer " == NULL)", value,                  \
                           format __VA_OPT__(, ) __VA_ARGS__)
#define RETURN_IF_NULL(pointer, format, ...)                                                       \
    RETURN_WITH_TEXT((pointer) == nullptr, "(" #pointer " == NULL)",                               \
                     format __VA_OPT__(, ) __VA_ARGS__)

// The condition's text is an argument of its own: it may hold a "%".
#define RETURN_VALUE_WITH_TEXT(failed, text, value, format, ...)                                   \
    do {                                                                                           \
        if (failed) {                                                                              \
            ::pelliko::logMessage(::pelliko::LogLevel::debug, __FILE_NAME__, __func__, __LINE__,   \
                                  "[ERROR][%s] Return value : %d, message : " format, text,        \
                                  ::pelliko::checkedValue(value) __VA_OPT__(, ) __VA_ARGS__);      \
            return value;                                                                          \
        }                                                                                          \
    } while (0)
#define RETURN_WITH_TEXT(failed, text, format, ...)                                                \
    do {                                                                                           \
        if (failed) {                                                                              \
            ::pelliko::logMessage(::pelliko::LogLevel::debug, __FILE_NAME__, __func__, __LINE__,   \
                                  "[ERROR][%s] Return message : " format,                          \
                                  text __VA_OPT__(, ) __VA_ARGS__);                                \
            return;                                                                                \
        }                                                                                          \
    } while (0)
