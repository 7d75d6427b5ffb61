#include "OutboxTransport.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <fstream>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <nlohmann/json.hpp>

#include "StateDir.h"

namespace pelliko::messaging
{
namespace
{

class Descriptor
{
public:
    explicit Descriptor(int fd) : fd_(fd) {}
    ~Descriptor()
    {
        if (fd_ >= 0)
            close(fd_);
    }
    Descriptor(const Descriptor &) = delete;
    Descriptor &operator=(const Descriptor &) = delete;
    int get() const { return fd_; }

private:
    int fd_;
};

std::string failure(const char *action, const std::string &path)
{
    return std::string("cannot ") + action + " " + path + ": " + std::strerror(errno);
}

std::string utcNow()
{
    const std::time_t now = std::time(nullptr);
    std::tm parts{};
    gmtime_r(&now, &parts);
    char text[32];
    std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%SZ", &parts);
    return text;
}

// A text cut in the middle of a character must still make a readable line.
std::string written(const nlohmann::ordered_json &value)
{
    return value.dump(-1, ' ', false, nlohmann::json::error_handler_t::replace);
}

std::string lineFor(const Sms &sms)
{
    nlohmann::ordered_json record;
    record["to"] = sms.to;
    record["text"] = sms.text;
    record["sim"] = sms.sim;
    record["time"] = utcNow();
    return written(record) + "\n";
}

// The beginning that all lines of the message to that number with that text have in common.
std::string beginningOf(const Sms &sms)
{
    nlohmann::ordered_json record;
    record["to"] = sms.to;
    record["text"] = sms.text;
    std::string text = written(record);
    text.back() = ',';
    return text;
}

// Half a line is no message: its writer was killed, and nobody will read it.
bool hasLine(std::istream &lines, const std::string &beginning)
{
    std::string line;
    while (std::getline(lines, line)) {
        if (line.starts_with(beginning) && line.back() == '}')
            return true;
    }
    return false;
}

// A writer that was killed may have left half a line; the new one then starts on its own.
bool endsInsideLine(int fd, off_t size)
{
    char last = '\n';
    return size > 0 && pread(fd, &last, 1, size - 1) == 1 && last != '\n';
}

std::string syncFolderOf(const std::string &path)
{
    const auto folder = std::filesystem::absolute(path).parent_path();
    const Descriptor directory(open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (directory.get() < 0 || fsync(directory.get()) != 0)
        return failure("sync", folder);
    return {};
}

// Takes half a line back, so that the reader never sees a message that was reported as failed.
std::string giveUp(int fd, off_t size, std::string reason)
{
    if (ftruncate(fd, size) != 0)
        return reason + "; the broken line could not be taken back";
    return reason;
}

} // namespace

OutboxTransport::OutboxTransport(std::string path) : path_(std::move(path)) {}

std::string OutboxTransport::defaultPath()
{
    const char *path = std::getenv("PELLIKO_SMS_OUTBOX");
    if (path && *path)
        return path;
    return std::filesystem::path(platform::stateDirectory()) / "sms-outbox.jsonl";
}

Fate OutboxTransport::fateOf(const Sms &sms)
{
    const Descriptor file(open(path_.c_str(), O_RDWR | O_CLOEXEC));
    if (file.get() < 0)
        return errno == ENOENT ? Fate::NotTaken : Fate::Unknown;
    // A writer that was killed has lost its lock by now; one that lives is waited for.
    if (flock(file.get(), LOCK_EX) != 0)
        return Fate::Unknown;
    std::ifstream lines(path_);
    const bool found = hasLine(lines, beginningOf(sms));
    if (lines.bad() || !lines.is_open())
        return Fate::Unknown;
    if (!found)
        return Fate::NotTaken;
    // Its writer may not have come to this.
    return fsync(file.get()) == 0 ? Fate::Taken : Fate::Unknown;
}

std::string OutboxTransport::send(const Sms &sms)
{
    const Descriptor file(open(path_.c_str(), O_RDWR | O_APPEND | O_CREAT | O_CLOEXEC, 0600));
    if (file.get() < 0)
        return failure("open", path_);
    // The lock ends with the descriptor.
    if (flock(file.get(), LOCK_EX) != 0)
        return failure("lock", path_);
    struct stat before {
    };
    if (fstat(file.get(), &before) != 0)
        return failure("examine", path_);

    std::string line = lineFor(sms);
    if (endsInsideLine(file.get(), before.st_size))
        line.insert(line.begin(), '\n');
    const ssize_t written = write(file.get(), line.data(), line.size());
    if (written < 0)
        return failure("write to", path_);
    if (static_cast<size_t>(written) != line.size())
        return giveUp(file.get(), before.st_size, "no room in " + path_);
    if (fsync(file.get()) != 0)
        return giveUp(file.get(), before.st_size, failure("sync", path_));
    return before.st_size == 0 ? syncFolderOf(path_) : std::string();
}

} // namespace pelliko::messaging
