#include "SourceFile.h"

#include <cerrno>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace pelliko::service
{
namespace
{
FileStamp stampFrom(const struct stat &info)
{
    return {info.st_size,
            static_cast<int64_t>(info.st_mtim.tv_sec) * 1'000'000'000 + info.st_mtim.tv_nsec};
}
} // namespace

bool stampOf(const std::string &path, FileStamp &stamp)
{
    struct stat info {
    };
    if (::stat(path.c_str(), &info) != 0 || !S_ISREG(info.st_mode)) {
        return false;
    }
    stamp = stampFrom(info);
    return true;
}

std::shared_ptr<SourceFile> SourceFile::open(const std::string &path, const FileStamp &stamp,
                                             std::string &failure)
{
    // Without O_NONBLOCK a pipe put in the file's place would hold the service up.
    const int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK);
    if (fd < 0) {
        failure = errno == ENOENT || errno == ENOTDIR ? "file_vanished" : "file_unreadable";
        return nullptr;
    }
    std::shared_ptr<SourceFile> file(new SourceFile(fd, stamp));
    if (!file->unchanged()) {
        failure = "file_changed";
        return nullptr;
    }
    return file;
}

SourceFile::~SourceFile()
{
    ::close(fd_);
}

int64_t SourceFile::read(char *buffer, int64_t length, int64_t position) const
{
    ssize_t got = 0;
    do {
        got = ::pread(fd_, buffer, static_cast<size_t>(length), position);
    } while (got < 0 && errno == EINTR);
    return got;
}

bool SourceFile::unchanged() const
{
    struct stat info {
    };
    return ::fstat(fd_, &info) == 0 && S_ISREG(info.st_mode) && stampFrom(info) == stamp_;
}

} // namespace pelliko::service
