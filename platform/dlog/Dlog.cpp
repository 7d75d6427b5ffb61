#include "dlog.h"

#include <array>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>
#include <sys/uio.h>
#include <syslog.h>
#include <systemd/sd-journal.h>
#include <unistd.h>

namespace
{

constexpr const char *kJournalSocket = "/run/systemd/journal/socket";

class KeepErrno
{
public:
    KeepErrno() : saved_(errno) {}
    ~KeepErrno() { errno = saved_; }
    KeepErrno(const KeepErrno &) = delete;
    KeepErrno &operator=(const KeepErrno &) = delete;

private:
    int saved_;
};

struct Level {
    int syslog;
    char letter;
};

// Indexed by log_priority.
constexpr std::array<Level, DLOG_PRIO_MAX> kLevels{{{LOG_INFO, 'U'},
                                                    {LOG_INFO, 'I'},
                                                    {LOG_DEBUG, 'V'},
                                                    {LOG_DEBUG, 'D'},
                                                    {LOG_INFO, 'I'},
                                                    {LOG_WARNING, 'W'},
                                                    {LOG_ERR, 'E'},
                                                    {LOG_CRIT, 'F'},
                                                    {LOG_DEBUG, 'S'}}};

iovec field(const std::string &text)
{
    return {const_cast<char *>(text.data()), text.size()};
}

bool writeJournal(const Level &level, const char *tag, const std::string &text)
{
    if (access(kJournalSocket, F_OK) != 0)
        return false;
    const std::string message = "MESSAGE=" + text;
    const std::string identifier = std::string("SYSLOG_IDENTIFIER=") + tag;
    const std::string priority = "PRIORITY=" + std::to_string(level.syslog);
    const std::array fields{field(message), field(identifier), field(priority)};
    return sd_journal_sendv(fields.data(), static_cast<int>(fields.size())) == 0;
}

// One write per line, so that lines of several threads and processes do not mix.
bool writeStderr(const Level &level, const char *tag, const std::string &text)
{
    const std::string line = std::string(1, level.letter) + "/" + tag + "(" +
                             std::to_string(getpid()) + "): " + text + "\n";
    ssize_t written = -1;
    do {
        written = write(STDERR_FILENO, line.data(), line.size());
    } while (written < 0 && errno == EINTR);
    return written >= 0;
}

bool copiesToStderr()
{
    static const bool copies = [] {
        const char *value = std::getenv("PELLIKO_LOG_STDERR");
        return value && std::strcmp(value, "1") == 0;
    }();
    return copies;
}

// False when the format cannot be printed.
bool format(std::string &out, const char *fmt, va_list ap)
{
    va_list again;
    va_copy(again, ap);
    const int length = vsnprintf(nullptr, 0, fmt, ap);
    if (length >= 0) {
        out.resize(static_cast<std::size_t>(length) + 1);
        vsnprintf(out.data(), out.size(), fmt, again);
        out.resize(static_cast<std::size_t>(length));
    }
    va_end(again);
    return length >= 0;
}

int print(log_priority prio, const char *tag, const char *fmt, va_list ap)
{
    const KeepErrno keep;
    if (!tag || !fmt || prio < DLOG_UNKNOWN || prio >= DLOG_PRIO_MAX)
        return DLOG_ERROR_INVALID_PARAMETER;
    if (prio == DLOG_SILENT)
        return 0;
    std::string text;
    if (!format(text, fmt, ap))
        return DLOG_ERROR_INVALID_PARAMETER;
    const Level &level = kLevels[prio];
    const bool journal = writeJournal(level, tag, text);
    const bool wantsStderr = !journal || copiesToStderr();
    const bool standardError = wantsStderr && writeStderr(level, tag, text);
    return journal || standardError ? static_cast<int>(text.size()) : DLOG_ERROR_NOT_PERMITTED;
}

} // namespace

int dlog_vprint(log_priority prio, const char *tag, const char *fmt, va_list ap)
{
    return print(prio, tag, fmt, ap);
}

int dlog_print(log_priority prio, const char *tag, const char *fmt, ...)
{
    va_list ap;
    va_start(ap, fmt);
    const int result = print(prio, tag, fmt, ap);
    va_end(ap);
    return result;
}
