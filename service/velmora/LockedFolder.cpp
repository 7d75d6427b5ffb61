#include "LockedFolder.h"

#include <cerrno>
#include <cstdio>
#include <utility>

#include <fcntl.h>
#include <glib.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

namespace pelliko::velmora
{
namespace
{
int lock(int fd)
{
    int result = flock(fd, LOCK_EX);
    while (result != 0 && errno == EINTR) {
        result = flock(fd, LOCK_EX);
    }
    return result == 0 ? 0 : -errno;
}

int missingIsFine(int result)
{
    return result == 0 || errno == ENOENT ? 0 : -errno;
}
} // namespace

Descriptor::~Descriptor()
{
    if (fd_ >= 0) {
        close(fd_);
    }
}

Descriptor &Descriptor::operator=(Descriptor &&other) noexcept
{
    std::swap(fd_, other.fd_);
    return *this;
}

int makePrivateFolder(const std::string &path)
{
    return g_mkdir_with_parents(path.c_str(), S_IRWXU) == 0 ? 0 : -errno;
}

// The lock is on the folder itself: it stays the same while files in it come, go and are renamed.
LockedFolder::LockedFolder(const std::string &path) : folder_(-1), error_(makePrivateFolder(path))
{
    if (error_ != 0) {
        return;
    }
    folder_ = Descriptor(::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    error_ = folder_.open() ? lock(folder_.get()) : -errno;
}

Descriptor LockedFolder::file(const char *name, int flags) const
{
    // Not blocking: somebody may have put a pipe there.
    Descriptor file(openat(folder_.get(), name, flags | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK,
                           S_IRUSR | S_IWUSR));
    struct stat info {
    };
    if (file.open() && fstat(file.get(), &info) == 0 && !S_ISREG(info.st_mode)) {
        errno = EIO;
        return Descriptor(-1);
    }
    return file;
}

int LockedFolder::rename(const char *from, const char *to) const
{
    return missingIsFine(renameat(folder_.get(), from, folder_.get(), to));
}

int LockedFolder::remove(const char *name) const
{
    return missingIsFine(unlinkat(folder_.get(), name, 0));
}

} // namespace pelliko::velmora
