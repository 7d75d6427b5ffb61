#include "DurableFile.h"

#include <cerrno>
#include <cstdlib>
#include <system_error>
#include <utility>

#include <fcntl.h>
#include <unistd.h>

namespace pelliko::contacts
{
namespace
{

[[noreturn]] void fail()
{
    throw std::system_error(errno, std::generic_category());
}

} // namespace

bool File::close()
{
    const int descriptor = std::exchange(m_descriptor, -1);
    return descriptor < 0 || ::close(descriptor) == 0;
}

bool writeAll(int descriptor, std::string_view bytes)
{
    while (!bytes.empty()) {
        const ssize_t written = ::write(descriptor, bytes.data(), bytes.size());
        if (written < 0 && errno == EINTR)
            continue;
        if (written < 0)
            return false;
        bytes.remove_prefix(static_cast<size_t>(written));
    }
    return true;
}

void syncFolder(const std::string &folder)
{
    const File opened(::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (opened.descriptor() < 0 || ::fsync(opened.descriptor()) != 0)
        fail();
}

// Written beside its place and renamed, so that a reader never sees half a file.
void replaceFile(const std::string &folder, const std::string &name, std::string_view bytes)
{
    const std::string path = folder + "/" + name;
    std::string temporary = folder + "/.new-XXXXXX";
    File file(::mkostemp(temporary.data(), O_CLOEXEC));
    if (file.descriptor() < 0)
        fail();
    const bool written = writeAll(file.descriptor(), bytes) && ::fsync(file.descriptor()) == 0 &&
                         file.close() && ::rename(temporary.c_str(), path.c_str()) == 0;
    if (!written) {
        const int error = errno;
        ::unlink(temporary.c_str());
        errno = error;
        fail();
    }
    syncFolder(folder);
}

} // namespace pelliko::contacts
