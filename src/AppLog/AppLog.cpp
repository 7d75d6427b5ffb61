#include "AppLog/AppLog.h"

#include "PellikoApp/CText.h"
#include "PellikoApp/TextFormat.h"

#include <algorithm>
#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <dlog.h>
#include <fcntl.h>
#include <ftw.h>
#include <iterator>
#include <langinfo.h>
#include <optional>
#include <pthread.h>
#include <sys/stat.h>
#include <sys/uio.h>
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
constexpr off_t rotationSize = 0x500000;
constexpr int maxCountedArchives = 4;
constexpr size_t archiveNameSize = 4096;
constexpr size_t commandSize = 4351;
constexpr size_t prefixSize = 512;

// One line at a time, a rotation and its subprocess included. Neither it nor the counters need a
// destructor: a detached thread may log until the very end of the process. A line is short work, so
// that a thread which finds the mutex taken is better off trying again than being put to sleep.
pthread_mutex_t g_mutex = PTHREAD_ADAPTIVE_MUTEX_INITIALIZER_NP;
int archive_count = 0;
bool initialised = false;

struct Lock {
    Lock() { pthread_mutex_lock(&g_mutex); }
    ~Lock() { pthread_mutex_unlock(&g_mutex); }
    Lock(const Lock &) = delete;
    Lock &operator=(const Lock &) = delete;
};

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

void _countArchives()
{
    struct stat info;
    if (stat(logDirectory, &info) != 0 || !S_ISDIR(info.st_mode))
        return;
    archive_count = 0;
    ftw(logDirectory, _countArchiveCb, 256);
}

void _initialiseOnce()
{
    if (initialised)
        return;
    _countArchives();
    initialised = true;
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

// The local time of a second; the C library is asked once for each. False when it cannot be told.
bool _localTime(time_t now, struct tm &local)
{
    static time_t known_second = -1;
    static struct tm known;
    if (now != known_second) {
        if (!localtime_r(&now, &known))
            return false;
        known_second = now;
    }
    local = known;
    return true;
}

// What stands before the message; a place would have to be very long to be cut.
size_t _printPrefix(char (&prefix)[prefixSize], const char *file, const char *function, int line,
                    const char *tag)
{
    const time_t now = time(nullptr);
    struct tm local;
    int length = 0;
    if (_localTime(now, local))
        length = snprintf(
            prefix, sizeof(prefix), "%.2d-%.2d-%.2d %.2d:%.2d:%.2d (%ld) [%s] %s: %s(%d) > ",
            local.tm_year + 1900, local.tm_mon + 1, local.tm_mday, local.tm_hour, local.tm_min,
            local.tm_sec, static_cast<long>(gettid()), tag, file, function, line);
    else
        length = snprintf(prefix, sizeof(prefix), "GET TIME ERROR (%ld) [%s] %s: %s(%d) > ",
                          static_cast<long>(gettid()), tag, file, function, line);
    return std::min(static_cast<size_t>(std::max(length, 0)), sizeof(prefix) - 1);
}

// On a full disk the rest of the line is lost.
void _writeLine(int out, char *prefix, size_t prefixLength, const char *message)
{
    char end[] = "\n";
    const iovec parts[] = {
        {prefix, prefixLength}, {const_cast<char *>(message), strlen(message)}, {end, 1}};
    while (writev(out, parts, std::size(parts)) < 0 && errno == EINTR)
        continue;
}

// The size of the file with the line in it; -1 when it cannot be told.
off_t _append(const char *file, const char *function, int line, const char *tag,
              const char *message)
{
    const int out = open(logPath, O_RDWR | O_CREAT | O_APPEND | O_CLOEXEC, 0666);
    if (out < 0)
        return -1;
    char prefix[prefixSize];
    const size_t length = _printPrefix(prefix, file, function, line, tag);
    _writeLine(out, prefix, length, message);
    const off_t size = lseek(out, 0, SEEK_END);
    close(out);
    return size;
}

void _appendLine(const char *file, const char *function, int line, const char *tag,
                 const char *message)
{
    const Lock lock;
    _initialiseOnce();
    if (_append(file, function, line, tag, message) < rotationSize)
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
