#include "AppLog/AppLog.h"

#include "PellikoApp/CText.h"
#include "PellikoApp/TextFormat.h"

#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <dlog.h>
#include <ftw.h>
#include <langinfo.h>
#include <mutex>
#include <optional>
#include <sys/stat.h>
#include <unistd.h>

namespace pelliko
{

namespace
{

constexpr const char *logDirectory = "/opt/usr/apps/com.velmora.pelliko/data/.app-logs";
constexpr const char *logPath = "/opt/usr/apps/com.velmora.pelliko/data/.app-logs/app.log";
constexpr const char *logName = "app.log";
constexpr const char *platformTag = "PELLIKO";
constexpr const char *fileTag = "PELLIKO:MESSAGE";
constexpr long rotationSize = 0x500000;
constexpr int maxCountedArchives = 4;
constexpr size_t archiveNameSize = 4096;
constexpr size_t commandSize = 4351;

// Everything below is guarded by this mutex. None of it needs a destructor: a detached thread may
// log until the very end of the process.
std::mutex g_mutex;
int archive_count = 0;
bool initialised = false;

// A trace reads the same in every language: "45.500000" also where people write a comma.
CText _format(const char *format, va_list arguments)
{
    std::optional<PlainNumbers> plain;
    if (strcmp(nl_langinfo(RADIXCHAR), ".") != 0)
        plain.emplace();
    char *text = nullptr;
    if (vasprintf(&text, format, arguments) < 0)
        text = nullptr;
    return CText(text);
}

int _countArchiveCb(const char *path, const struct stat *, int type)
{
    const char *slash = strrchr(path, '/');
    const char *name = slash ? slash + 1 : path;
    if (type == FTW_F && strcmp(name, "app") == 0)
        ++archive_count;
    return archive_count >= maxCountedArchives ? 1 : 0;
}

void _initialise()
{
    initialised = true;
    struct stat info;
    if (stat(logDirectory, &info) != 0 || !S_ISDIR(info.st_mode))
        return;
    archive_count = 0;
    ftw(logDirectory, _countArchiveCb, 256);
}

void _archiveName(char (&name)[archiveNameSize], int number)
{
    snprintf(name, sizeof(name), "%s.%d.tar.gz", logPath, number);
}

void _rotate()
{
    for (int i = archive_count; i >= 1; --i) {
        char from[archiveNameSize];
        char to[archiveNameSize];
        _archiveName(from, i);
        _archiveName(to, i + 1);
        rename(from, to);
    }
    char command[commandSize];
    snprintf(command, sizeof(command), "tar -czf %s.1.tar.gz -C %s %s", logPath, logDirectory,
             logName);
    if (system(command) != -1 && archive_count < maxCountedArchives)
        ++archive_count;
}

void _writePrefix(FILE *out, const char *file, const char *function, int line, const char *tag)
{
    const time_t now = time(nullptr);
    struct tm local;
    if (localtime_r(&now, &local))
        fprintf(out, "%.2d-%.2d-%.2d %.2d:%.2d:%.2d (%ld) [%s] %s: %s(%d) > ", local.tm_year + 1900,
                local.tm_mon + 1, local.tm_mday, local.tm_hour, local.tm_min, local.tm_sec,
                static_cast<long>(gettid()), tag, file, function, line);
    else
        fprintf(out, "GET TIME ERROR (%ld) [%s] %s: %s(%d) > ", static_cast<long>(gettid()), tag,
                file, function, line);
}

// The size of an open file; -1 when it cannot be read.
long _sizeOf(FILE *file)
{
    const long position = ftell(file);
    if (position < 0 || fseek(file, 0, SEEK_END) != 0)
        return -1;
    const long size = ftell(file);
    return fseek(file, position, SEEK_SET) == 0 ? size : -1;
}

void _appendLine(const char *file, const char *function, int line, const char *tag,
                 const char *message)
{
    const std::lock_guard lock(g_mutex);
    if (!initialised)
        _initialise();
    FILE *out = fopen(logPath, "a+");
    if (!out)
        return;
    _writePrefix(out, file, function, line, tag);
    fprintf(out, "%s\n", message);
    fflush(out);
    const long size = _sizeOf(out);
    fclose(out);
    if (size < rotationSize)
        return;
    _rotate();
    if (truncate(logPath, 0) != 0)
        return; // the next line tries again
}

} // namespace

void appLogWrite(const char *file, const char *function, int line, const char *tag,
                 const char *format, ...)
{
    va_list arguments;
    va_start(arguments, format);
    const CText message = _format(format, arguments);
    va_end(arguments);
    if (message)
        _appendLine(file, function, line, tag, message.get());
}

void logMessage(LogLevel level, const char *file, const char *function, int line,
                const char *format, ...)
{
    va_list arguments;
    va_start(arguments, format);
    const CText message = _format(format, arguments);
    va_end(arguments);
    if (!message)
        return;
    const bool error = level == LogLevel::error;
    dlog_print(error ? DLOG_ERROR : DLOG_DEBUG, platformTag, "%s: %s(%d) > %s%s", file, function,
               line, error ? "[ERROR]" : "", message.get());
    _appendLine(file, function, line, fileTag, message.get());
}

} // namespace pelliko
