#include "LockedFolder.h"

#include <cerrno>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

namespace pelliko::korrin
{
namespace
{

// Closes without touching the reason that the caller is about to report.
void closeQuietly(int file)
{
    const int reason = errno;
    close(file);
    errno = reason;
}

// One name, so that what a crash left behind is written over next time and holds no secret for
// ever.
std::string draftOf(const std::string &name)
{
    return name + ".new";
}

bool writeAll(int file, const std::string &contents)
{
    size_t done = 0;
    while (done < contents.size()) {
        const ssize_t written = write(file, contents.data() + done, contents.size() - done);
        if (written < 0 && errno != EINTR)
            return false;
        done += written > 0 ? static_cast<size_t>(written) : 0;
    }
    return fsync(file) == 0;
}

bool unlinkIfThere(int folder, const std::string &name)
{
    return unlinkat(folder, name.c_str(), 0) == 0 || errno == ENOENT;
}

} // namespace

LockedFolder::LockedFolder(const std::string &folder)
    : folder_(open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC))
{
    if (folder_ < 0)
        return;
    int result = 0;
    do {
        result = flock(folder_, LOCK_EX);
    } while (result != 0 && errno == EINTR);
    if (result != 0) {
        closeQuietly(folder_);
        folder_ = -1;
    }
}

LockedFolder::~LockedFolder()
{
    if (folder_ >= 0)
        closeQuietly(folder_);
}

bool LockedFolder::replace(const std::string &name, const std::string &contents) const
{
    const std::string draft = draftOf(name);
    // A link of that name, whoever made it, must not lead the secret elsewhere.
    if (!unlinkIfThere(folder_, draft))
        return false;
    const int file =
        openat(folder_, draft.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, 0600);
    if (file < 0)
        return false;
    const bool written = writeAll(file, contents);
    closeQuietly(file);
    if (written && renameat(folder_, draft.c_str(), folder_, name.c_str()) == 0)
        return fsync(folder_) == 0;
    const int reason = errno;
    unlinkIfThere(folder_, draft);
    errno = reason;
    return false;
}

bool LockedFolder::remove(const std::string &name) const
{
    return unlinkIfThere(folder_, draftOf(name)) && unlinkIfThere(folder_, name) &&
           fsync(folder_) == 0;
}

} // namespace pelliko::korrin
