#pragma once

#include "store/Blobs.h"

#include <filesystem>

namespace pelliko::server
{

/// Blobs as files of one directory: ROOT/ab/abcdef…, the sub-directory being the key's first two
/// characters.
class DirectoryBlobs final : public Blobs
{
public:
    /// Makes the directory, for its owner alone, when it is absent.
    explicit DirectoryBlobs(std::filesystem::path root);

    std::unique_ptr<BlobWriter> openForWriting(const std::string &key) override;
    std::unique_ptr<BlobReader> openForReading(const std::string &key) override;
    std::vector<std::string> keys() override;
    void remove(const std::string &key) override;

private:
    [[nodiscard]] std::filesystem::path pathOf(const std::string &key) const;

    std::filesystem::path m_root;
};

} // namespace pelliko::server
