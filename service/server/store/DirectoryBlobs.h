#pragma once

#include "store/Blobs.h"

#include <filesystem>

namespace pelliko::server
{

/// Blobs as files of one directory: ROOT/ab/abcdef…, the sub-directory being the key's first two
/// characters.
class DirectoryBlobs : public Blobs
{
public:
    /// Makes the directory, for its owner alone, when it is absent.
    explicit DirectoryBlobs(std::filesystem::path root);

    std::unique_ptr<BlobWriter> openForWriting(const std::string &key) override;
    std::unique_ptr<BlobReader> openForReading(const std::string &key) override;
    std::vector<StoredBlob> list(const std::string &after, std::size_t most) override;
    std::optional<std::uint64_t> sizeOf(const std::string &key) override;
    void remove(const std::string &key) override;
    /// In ROOT/migration.
    std::optional<StoreMark> mark() override;
    void setMark(const std::optional<StoreMark> &mark) override;

private:
    [[nodiscard]] std::filesystem::path pathOf(const std::string &key) const;
    [[nodiscard]] std::filesystem::path markFile() const { return m_root / "migration"; }

    std::filesystem::path m_root;
};

} // namespace pelliko::server
