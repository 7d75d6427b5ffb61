#include "store/DirectoryBlobs.h"

#include "store/StorageFailure.h"
#include "text/Secrets.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <fstream>
#include <utility>

namespace pelliko::server
{
namespace
{

namespace fs = std::filesystem;

[[noreturn]] void fail(const char *what, const fs::path &path)
{
    const int error = errno;
    const bool full = error == ENOSPC || error == EDQUOT || error == EFBIG;
    throw StorageFailure(full ? StorageFailure::Kind::full : StorageFailure::Kind::broken,
                         std::string(what) + " " + path.string() + ": " + std::strerror(error));
}

/// An open file, closed with its owner.
class File
{
public:
    File(int descriptor, fs::path path) : m_descriptor(descriptor), m_path(std::move(path)) {}
    File(const File &) = delete;
    File &operator=(const File &) = delete;
    File(File &&other) noexcept
        : m_descriptor(std::exchange(other.m_descriptor, -1)), m_path(std::move(other.m_path))
    {
    }
    File &operator=(File &&) = delete;
    ~File()
    {
        if (m_descriptor >= 0)
            close(m_descriptor);
    }

    [[nodiscard]] int get() const { return m_descriptor; }
    [[nodiscard]] const fs::path &path() const { return m_path; }

private:
    int m_descriptor;
    fs::path m_path;
};

void syncDirectory(const fs::path &path)
{
    File directory(open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC), path);
    if (directory.get() < 0 || fsync(directory.get()) != 0)
        fail("cannot sync", path);
}

/// Of the sub-directories: the first characters of a key.
constexpr std::size_t folderName = 2;

/// In the order of their bytes.
std::vector<std::string> namesIn(const fs::path &directory)
{
    std::vector<std::string> names;
    if (!fs::is_directory(directory))
        return names;
    for (const auto &entry : fs::directory_iterator(directory))
        names.push_back(entry.path().filename().string());
    std::sort(names.begin(), names.end());
    return names;
}

void makeDirectory(const fs::path &path)
{
    if (mkdir(path.c_str(), 0700) != 0 && errno != EEXIST)
        fail("cannot make", path);
}

class FileWriter final : public BlobWriter
{
public:
    FileWriter(File file, bool isNew) : m_file(std::move(file)), m_nameUnsynced(isNew) {}

    void write(std::uint64_t offset, std::string_view bytes) override
    {
        while (!bytes.empty()) {
            const ssize_t count =
                pwrite(m_file.get(), bytes.data(), bytes.size(), static_cast<off_t>(offset));
            if (count < 0 && errno == EINTR)
                continue;
            if (count < 0)
                fail("cannot write", m_file.path());
            bytes.remove_prefix(static_cast<std::size_t>(count));
            offset += static_cast<std::uint64_t>(count);
        }
    }

    void truncate(std::uint64_t size) override
    {
        if (ftruncate(m_file.get(), static_cast<off_t>(size)) != 0)
            fail("cannot shorten", m_file.path());
    }

    void sync() override
    {
        if (fdatasync(m_file.get()) != 0)
            fail("cannot sync", m_file.path());
        if (m_nameUnsynced.load()) {
            syncDirectory(m_file.path().parent_path());
            syncDirectory(m_file.path().parent_path().parent_path());
            m_nameUnsynced.store(false);
        }
    }

private:
    File m_file;
    // A new file whose directory is not synced is gone after a power cut, however often it was
    // synced.
    std::atomic<bool> m_nameUnsynced;
};

class FileReader final : public BlobReader
{
public:
    explicit FileReader(File file) : m_file(std::move(file)) {}

    std::size_t read(std::uint64_t offset, std::span<char> into) override
    {
        while (true) {
            const ssize_t count =
                pread(m_file.get(), into.data(), into.size(), static_cast<off_t>(offset));
            if (count >= 0)
                return static_cast<std::size_t>(count);
            if (errno != EINTR)
                fail("cannot read", m_file.path());
        }
    }

    [[nodiscard]] int descriptor() const override { return m_file.get(); }

private:
    File m_file;
};

} // namespace

DirectoryBlobs::DirectoryBlobs(fs::path root) : m_root(std::move(root))
{
    makeDirectory(m_root);
}

fs::path DirectoryBlobs::pathOf(const std::string &key) const
{
    if (!looksLikeToken(key))
        throw StorageFailure(StorageFailure::Kind::broken, "not a blob's key");
    return m_root / key.substr(0, folderName) / key;
}

std::unique_ptr<BlobWriter> DirectoryBlobs::openForWriting(const std::string &key)
{
    const fs::path path = pathOf(key);
    makeDirectory(path.parent_path());
    File file(open(path.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0600), path);
    if (file.get() < 0)
        fail("cannot open", path);
    struct stat info {
    };
    if (fstat(file.get(), &info) != 0)
        fail("cannot look at", path);
    // An empty file may be one whose name was never synced.
    return std::make_unique<FileWriter>(std::move(file), info.st_size == 0);
}

std::unique_ptr<BlobReader> DirectoryBlobs::openForReading(const std::string &key)
{
    const fs::path path = pathOf(key);
    File file(open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW), path);
    if (file.get() < 0 && errno == ENOENT)
        return nullptr;
    if (file.get() < 0)
        fail("cannot open", path);
    return std::make_unique<FileReader>(std::move(file));
}

std::vector<StoredBlob> DirectoryBlobs::list(const std::string &after, std::size_t most)
{
    std::vector<StoredBlob> found;
    try {
        for (const std::string &folder : namesIn(m_root)) {
            if (folder.size() != folderName || folder < after.substr(0, folderName))
                continue;
            if (found.size() >= most)
                break;
            for (const std::string &name : namesIn(m_root / folder)) {
                // What stands elsewhere, or is named otherwise, was put there by somebody else.
                const bool isBlob = looksLikeToken(name) && name.substr(0, folderName) == folder;
                const auto size = isBlob && name > after ? sizeOf(name) : std::nullopt;
                if (size)
                    found.push_back({name, size});
            }
        }
    } catch (const fs::filesystem_error &error) {
        throw StorageFailure(StorageFailure::Kind::broken, error.what());
    }
    return found;
}

std::optional<std::uint64_t> DirectoryBlobs::sizeOf(const std::string &key)
{
    const fs::path path = pathOf(key);
    struct stat info {
    };
    if (lstat(path.c_str(), &info) == 0)
        return S_ISREG(info.st_mode) ? std::optional(static_cast<std::uint64_t>(info.st_size))
                                     : std::nullopt;
    if (errno != ENOENT && errno != ENOTDIR)
        fail("cannot look at", path);
    return std::nullopt;
}

void DirectoryBlobs::remove(const std::string &key)
{
    const fs::path path = pathOf(key);
    if (unlink(path.c_str()) != 0 && errno != ENOENT)
        fail("cannot remove", path);
}

std::optional<StoreMark> DirectoryBlobs::mark()
{
    std::ifstream file(markFile());
    std::string text;
    std::getline(file, text);
    return markOf(text);
}

void DirectoryBlobs::setMark(const std::optional<StoreMark> &mark)
{
    if (mark) {
        const fs::path fresh = m_root / "migration.new";
        FileWriter writer(
            File(open(fresh.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC | O_NOFOLLOW, 0600),
                 fresh),
            false);
        writer.write(0, textOf(*mark) + "\n");
        writer.sync();
        if (rename(fresh.c_str(), markFile().c_str()) != 0)
            fail("cannot name", markFile());
    } else if (unlink(markFile().c_str()) != 0 && errno != ENOENT) {
        fail("cannot remove", markFile());
    }
    syncDirectory(m_root);
}

} // namespace pelliko::server
