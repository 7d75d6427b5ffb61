#include "RecordLog.h"

#include "LockedFolder.h"

#include <cerrno>
#include <filesystem>

#include <fcntl.h>
#include <glib.h>
#include <sys/stat.h>
#include <unistd.h>

namespace pelliko::velmora
{
namespace
{
constexpr const char *current = "usage.jsonl";
constexpr const char *older = "usage.1.jsonl";
constexpr int appending = O_RDWR | O_APPEND | O_CREAT;

int64_t sizeOf(const Descriptor &file)
{
    struct stat info {
    };
    return fstat(file.get(), &info) == 0 ? info.st_size : -1;
}

// A loss of power may have left half a line; the next one then starts on its own.
bool endsInsideLine(const Descriptor &file, int64_t size)
{
    char last = '\n';
    return size > 0 && pread(file.get(), &last, 1, size - 1) == 1 && last != '\n';
}

// Half a line is taken back: the reader never sees a record that was reported as failed.
int writeWhole(const Descriptor &file, int64_t size, const std::string &text)
{
    const ssize_t written = write(file.get(), text.data(), text.size());
    if (written == static_cast<ssize_t>(text.size())) {
        return 0;
    }
    const int error = written < 0 ? errno : ENOSPC;
    return ftruncate(file.get(), size) == 0 ? -error : -EIO;
}

int appendTo(const Descriptor &file, const std::string &line)
{
    const int64_t size = sizeOf(file);
    if (size < 0) {
        return -errno;
    }
    return writeWhole(file, size, endsInsideLine(file, size) ? "\n" + line : line);
}

// The file that has room for the line.
Descriptor fileWithRoom(const LockedFolder &folder, size_t length, int64_t most)
{
    Descriptor file = folder.file(current, appending);
    if (!file.open() || sizeOf(file) + static_cast<int64_t>(length) <= most) {
        return file;
    }
    const int error = folder.rename(current, older);
    if (error != 0) {
        errno = -error;
        return Descriptor(-1);
    }
    return folder.file(current, appending);
}

int readAll(const Descriptor &file, std::string &text)
{
    char buffer[65536];
    ssize_t count = 0;
    while ((count = ::read(file.get(), buffer, sizeof buffer)) > 0) {
        text.append(buffer, static_cast<size_t>(count));
    }
    return count == 0 ? 0 : -errno;
}

void splitLines(const std::string &text, std::vector<std::string> &lines)
{
    for (size_t start = 0; start < text.size();) {
        const size_t end = std::min(text.find('\n', start), text.size());
        lines.push_back(text.substr(start, end - start));
        start = end + 1;
    }
}

// A choice about privacy is not lost with the power.
int syncFolderOf(const std::string &path)
{
    const std::string folder = std::filesystem::path(path).parent_path();
    const Descriptor directory(open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    return directory.open() && fsync(directory.get()) == 0 ? 0 : -errno;
}
} // namespace

RecordLogPlace RecordLogPlace::ofUser()
{
    g_autofree char *records = g_build_filename(g_get_user_state_dir(), "velmora", nullptr);
    g_autofree char *switched =
        g_build_filename(g_get_user_config_dir(), "velmora", "usage-log-off", nullptr);
    RecordLogPlace place;
    place.folder = records;
    place.switchFile = switched;
    return place;
}

int RecordLog::prepare() const
{
    return makePrivateFolder(place_.folder);
}

int RecordLog::append(const std::string &line) const
{
    const int64_t most = place_.limit / 2;
    if (static_cast<int64_t>(line.size()) > most) {
        return -EINVAL;
    }
    const LockedFolder folder(place_.folder);
    if (folder.error() != 0) {
        return folder.error();
    }
    if (!collecting()) {
        return -EPERM;
    }
    const Descriptor file = fileWithRoom(folder, line.size() + 1, most);
    return file.open() ? appendTo(file, line) : -errno;
}

int RecordLog::read(std::vector<std::string> &lines) const
{
    std::string text;
    const LockedFolder folder(place_.folder);
    if (folder.error() != 0) {
        return folder.error();
    }
    for (const char *name : {older, current}) {
        const Descriptor file = folder.file(name, O_RDONLY);
        const int error = file.open() ? readAll(file, text) : -errno;
        if (error != 0 && error != -ENOENT) {
            return error;
        }
        if (!text.empty() && text.back() != '\n') {
            text += '\n';
        }
    }
    splitLines(text, lines);
    return 0;
}

int RecordLog::clear() const
{
    const LockedFolder folder(place_.folder);
    if (folder.error() != 0) {
        return folder.error();
    }
    const int error = folder.remove(older);
    const int last = folder.remove(current);
    return error != 0 ? error : last;
}

bool RecordLog::collecting() const
{
    struct stat info {
    };
    return lstat(place_.switchFile.c_str(), &info) != 0 && (errno == ENOENT || errno == ENOTDIR);
}

int RecordLog::setCollecting(bool on) const
{
    // Whoever is appending finishes first. Without the folder nobody is.
    const LockedFolder folder(place_.folder);
    if (!on) {
        return switchOff();
    }
    if (unlink(place_.switchFile.c_str()) != 0) {
        return errno == ENOENT || errno == ENOTDIR ? 0 : -errno;
    }
    return syncFolderOf(place_.switchFile);
}

int RecordLog::switchOff() const
{
    const int error = makePrivateFolder(std::filesystem::path(place_.switchFile).parent_path());
    if (error != 0) {
        return error;
    }
    const Descriptor file(open(place_.switchFile.c_str(),
                               O_WRONLY | O_CREAT | O_CLOEXEC | O_NOFOLLOW, S_IRUSR | S_IWUSR));
    if (!file.open() || fsync(file.get()) != 0) {
        return -errno;
    }
    return syncFolderOf(place_.switchFile);
}

std::string RecordLog::file() const
{
    return place_.folder + "/" + current;
}

} // namespace pelliko::velmora
