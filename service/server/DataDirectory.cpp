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

DataLock::DataLock(const fs::path &directory)
    : m_file(open((directory / "lock").c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600))
{
    if (m_file < 0)
        throw std::runtime_error("cannot open the lock in " + directory.string() + ": " +
                                 std::strerror(errno));
    if (flock(m_file, LOCK_EX | LOCK_NB) != 0) {
        close(m_file);
        throw std::runtime_error("another server serves " + directory.string());
    }
}

DataLock::~DataLock()
{
    close(m_file);
}

} // namespace pelliko::server
