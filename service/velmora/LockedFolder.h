// A private folder whose files one process or thread at a time works on.
#pragma once

#include <string>

namespace pelliko::velmora
{

/// A file descriptor, closed with the object. May hold none (-1).
class Descriptor
{
public:
    explicit Descriptor(int fd) : fd_(fd) {}
    ~Descriptor();
    Descriptor(Descriptor &&other) noexcept : fd_(other.fd_) { other.fd_ = -1; }
    Descriptor &operator=(Descriptor &&other) noexcept;
    Descriptor(const Descriptor &) = delete;
    Descriptor &operator=(const Descriptor &) = delete;

    int get() const { return fd_; }
    bool open() const { return fd_ >= 0; }

private:
    int fd_;
};

/// Makes the folder and its missing parents, all 0700. 0 or a negated errno value.
int makePrivateFolder(const std::string &path);

/// Makes the folder when it is missing and holds its lock until the object goes. Holders only read
/// or write a few KiB, so that waiting for the lock is not felt.
class LockedFolder
{
public:
    explicit LockedFolder(const std::string &path);

    /// 0, or why the folder could not be made, opened or locked (negated errno value).
    int error() const { return error_; }

    /// Opens or makes a regular file of the folder, mode 0600; without one errno says why.
    Descriptor file(const char *name, int flags) const;

    /// Gives a file another name, replacing what had it; takes a file away. 0 or a negated errno
    /// value, and 0 for a file that does not exist.
    int rename(const char *from, const char *to) const;
    int remove(const char *name) const;

private:
    Descriptor folder_;
    int error_ = 0;
};

} // namespace pelliko::velmora
