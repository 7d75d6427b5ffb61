// A folder whose files are replaced whole, by one writer at a time.
#pragma once

#include <string>

namespace pelliko::korrin
{

/// Keeps other writers of the folder away while it lives, also those of other processes; the
/// system lets go of it when the process dies. Every call leaves the reason of a failure in errno.
class LockedFolder
{
public:
    /// Waits for whoever has the folder. Not held when it cannot be opened.
    explicit LockedFolder(const std::string &folder);
    ~LockedFolder();
    LockedFolder(const LockedFolder &) = delete;
    LockedFolder &operator=(const LockedFolder &) = delete;

    bool held() const { return folder_ >= 0; }

    /// Gives a file new contents for the user alone: whoever reads it, or looks after a crash,
    /// finds the old contents or the new ones. They are on the disk on return.
    bool replace(const std::string &name, const std::string &contents) const;

    /// The disk has forgotten the file on return. There being none is no failure.
    bool remove(const std::string &name) const;

private:
    int folder_;
};

} // namespace pelliko::korrin
