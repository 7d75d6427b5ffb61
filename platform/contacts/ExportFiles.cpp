#include "ExportFiles.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <memory>
#include <system_error>
#include <utility>

#include <fcntl.h>
#include <glib.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

namespace pelliko::contacts
{
namespace
{

constexpr size_t stem_limit = 100;
constexpr size_t buffer_size = size_t{256} << 10;
constexpr const char *ending = ".vcf";
constexpr const char *staging_start = ".export-";

[[noreturn]] void fail()
{
    throw std::system_error(errno, std::generic_category());
}

bool isSeparator(gunichar letter)
{
    constexpr const char *separators = "/\\:*?\"<>|";
    return !g_unichar_isprint(letter) || (letter < 0x80 && std::strchr(separators, int(letter)));
}

std::string trimmed(const std::string &text)
{
    const size_t first = text.find_first_not_of(" .");
    if (first == std::string::npos)
        return {};
    return text.substr(first, text.find_last_not_of(" .") - first + 1);
}

// A descriptor that holds the folder's lock, or -1 with errno: EWOULDBLOCK when it is in use.
int lockedFolder(const std::string &folder)
{
    const int descriptor = ::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC);
    if (descriptor < 0 || ::flock(descriptor, LOCK_EX | LOCK_NB) == 0)
        return descriptor;
    const int error = errno;
    ::close(descriptor);
    errno = error;
    return -1;
}

// Hidden folders of exports whose program has ended. What cannot be removed is no reason to fail.
void removeLeftovers(const std::string &directory)
{
    std::error_code ignored;
    std::filesystem::directory_iterator entries(directory, ignored);
    for (; entries != std::filesystem::directory_iterator(); entries.increment(ignored)) {
        const std::filesystem::path &path = entries->path();
        if (!path.filename().string().starts_with(staging_start))
            continue;
        const File lock(lockedFolder(path));
        std::error_code not_removed;
        if (lock.descriptor() >= 0)
            std::filesystem::remove_all(path, not_removed);
    }
}

} // namespace

std::string fileStem(const std::string &name)
{
    const std::unique_ptr<char, decltype(&g_free)> valid(
        g_utf8_make_valid(name.data(), static_cast<gssize>(name.size())), g_free);
    std::string stem;
    for (const char *at = valid.get(); *at != '\0'; at = g_utf8_next_char(at)) {
        const auto size = static_cast<size_t>(g_utf8_next_char(at) - at);
        if (stem.size() + size > stem_limit)
            break;
        if (isSeparator(g_utf8_get_char(at)))
            stem += '_';
        else
            stem.append(at, size);
    }
    stem = trimmed(stem);
    return stem.empty() ? "contact" : stem;
}

ExportFiles::ExportFiles(std::string directory) : m_directory(std::move(directory))
{
    while (m_directory.size() > 1 && m_directory.back() == '/')
        m_directory.pop_back();
    removeLeftovers(m_directory);
    makeStaging();
}

void ExportFiles::makeStaging()
{
    struct stat state {
    };
    // Until it is locked, another export may take it for a left one.
    do {
        std::string staging = m_directory + "/" + staging_start + "XXXXXX";
        if (!::mkdtemp(staging.data()))
            fail();
        m_staging = std::move(staging);
        m_staging_lock.reset(lockedFolder(m_staging));
        if (m_staging_lock.descriptor() < 0 && errno != ENOENT && errno != EWOULDBLOCK) {
            const int error = errno;
            ::rmdir(m_staging.c_str());
            errno = error;
            fail();
        }
    } while (m_staging_lock.descriptor() < 0 || ::fstat(m_staging_lock.descriptor(), &state) != 0 ||
             state.st_nlink == 0);
}

ExportFiles::~ExportFiles()
{
    std::error_code ignored;
    std::filesystem::remove_all(m_staging, ignored);
}

std::string ExportFiles::stagedPath(size_t index) const
{
    return m_staging + "/" + std::to_string(index);
}

void ExportFiles::begin(std::string stem)
{
    finish();
    const std::string path = stagedPath(count());
    m_file.reset(::open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0600));
    if (m_file.descriptor() < 0)
        fail();
    m_stems.push_back(std::move(stem));
}

void ExportFiles::write(std::string_view text)
{
    m_buffer.append(text);
    if (m_buffer.size() >= buffer_size)
        flush();
}

void ExportFiles::flush()
{
    if (!writeAll(m_file.descriptor(), m_buffer))
        fail();
    m_buffer.clear();
}

void ExportFiles::finish()
{
    if (m_file.descriptor() < 0)
        return;
    flush();
    if (::fsync(m_file.descriptor()) != 0 || !m_file.close())
        fail();
}

std::string ExportFiles::publish(size_t index)
{
    const std::string staged = stagedPath(index);
    const std::string &stem = m_stems.at(index);
    for (int &number = m_next_number[stem];;) {
        ++number;
        std::string name =
            number == 1 ? stem + ending : stem + " (" + std::to_string(number) + ")" + ending;
        const std::string path = m_directory + "/" + name;
        if (::renameat2(AT_FDCWD, staged.c_str(), AT_FDCWD, path.c_str(), RENAME_NOREPLACE) == 0)
            return name;
        if (errno != EEXIST)
            fail();
    }
}

} // namespace pelliko::contacts
