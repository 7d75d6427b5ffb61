#pragma once

#include <filesystem>

namespace pelliko::server
{

/// Makes the server's directory, for its owner alone, when it is absent.
void makeDataDirectory(const std::filesystem::path &directory);

[[nodiscard]] std::filesystem::path metadataFile(const std::filesystem::path &directory);
[[nodiscard]] std::filesystem::path blobsDirectory(const std::filesystem::path &directory);

/// Held by the one server that serves a directory: two would not know of each other's writers.
class DataLock
{
public:
    /// Throws std::runtime_error when another server has the directory.
    explicit DataLock(const std::filesystem::path &directory);
    ~DataLock();
    DataLock(const DataLock &) = delete;
    DataLock &operator=(const DataLock &) = delete;

private:
    int m_file;
};

} // namespace pelliko::server
