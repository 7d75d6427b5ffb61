#include "DataDirectory.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <stdexcept>
#include <string>

namespace pelliko::server
{

namespace fs = std::filesystem;

void makeDataDirectory(const fs::path &directory)
{
    std::error_code error;
    if (directory.has_parent_path())
        fs::create_directories(directory.parent_path(), error);
    if (mkdir(directory.c_str(), 0700) != 0 && errno != EEXIST)
        throw std::runtime_error("cannot make " + directory.string() + ": " + std::strerror(errno));
}

fs::path metadataFile(const fs::path &directory)
{
    return directory / "metadata.db";
}
fs::path blobsDirectory(const fs::path &directory)
{
    return directory / "blobs";
}

std::shared_ptr<const void> tryLock(const fs::path &file)
{
    struct Holder {
        explicit Holder(int d) : descriptor(d) {}
        ~Holder()
        {
            if (descriptor >= 0)
                close(descriptor);
        }
        Holder(const Holder &) = delete;
        Holder &operator=(const Holder &) = delete;
        int descriptor;
    };
    auto holder =
        std::make_shared<const Holder>(open(file.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600));
    if (holder->descriptor < 0)
        throw std::runtime_error("cannot open the lock " + file.string() + ": " +
                                 std::strerror(errno));
    if (flock(holder->descriptor, LOCK_EX | LOCK_NB) != 0)
        return nullptr;
    return holder;
}

fs::path serversLock(const fs::path &directory)
{
    return directory / "lock";
}

} // namespace pelliko::server
