#include "PartFile.h"

#include <cerrno>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>
#include <utility>

namespace pelliko::service
{
namespace
{
constexpr long partialContent = 206;
}

PartFile::PartFile(std::string path, int64_t from, int64_t size)
    : path_(std::move(path)), from_(from), size_(size)
{
}

PartFile::~PartFile()
{
    close();
}

bool PartFile::begin(long status)
{
    const std::lock_guard lock(mutex_);
    if (abandoned_) {
        return failed("disk_failed");
    }
    // The whole file comes when the server does not do parts.
    written_ = status == partialContent ? from_ : 0;
    const int empty = written_ == 0 ? O_TRUNC : 0;
    file_ = open(path_.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC | O_NOFOLLOW | empty, 0666);
    if (file_ < 0 || lseek(file_, written_, SEEK_SET) < 0) {
        return failedBySystem();
    }
    return true;
}

bool PartFile::take(std::string_view piece)
{
    const std::lock_guard lock(mutex_);
    if (abandoned_) {
        return failed("disk_failed");
    }
    if (static_cast<int64_t>(piece.size()) > size_ - written_) {
        return failed("too_much");
    }
    return write(piece);
}

bool PartFile::write(std::string_view piece)
{
    while (!piece.empty()) {
        const ssize_t done = ::write(file_, piece.data(), piece.size());
        if (done < 0 && errno == EINTR) {
            continue;
        }
        if (done <= 0) {
            return failedBySystem();
        }
        written_ += done;
        piece.remove_prefix(static_cast<size_t>(done));
    }
    return true;
}

bool PartFile::end()
{
    const std::lock_guard lock(mutex_);
    if (abandoned_ || written_ != size_) {
        return failed("connection_lost");
    }
    // On disk before it gets its name: a name says that the file is whole.
    if (fsync(file_) != 0) {
        return failedBySystem();
    }
    close();
    return true;
}

std::string PartFile::fault() const
{
    const std::lock_guard lock(mutex_);
    return fault_;
}

void PartFile::abandon()
{
    const std::lock_guard lock(mutex_);
    abandoned_ = true;
    close();
}

bool PartFile::failed(const char *fault)
{
    fault_ = fault;
    return false;
}

bool PartFile::failedBySystem()
{
    const bool full = errno == ENOSPC || errno == EDQUOT || errno == EFBIG;
    return failed(full ? "disk_full" : "disk_failed");
}

void PartFile::close()
{
    if (file_ >= 0) {
        ::close(std::exchange(file_, -1));
    }
}

int64_t sizeOfPart(const std::string &path)
{
    struct stat status {
    };
    const bool file = lstat(path.c_str(), &status) == 0 && S_ISREG(status.st_mode);
    return file ? status.st_size : 0;
}

} // namespace pelliko::service
