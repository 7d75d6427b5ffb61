#pragma once

#include <filesystem>
#include <memory>

namespace pelliko::server
{

/// Makes the server's directory, for its owner alone, when it is absent.
void makeDataDirectory(const std::filesystem::path &directory);

[[nodiscard]] std::filesystem::path metadataFile(const std::filesystem::path &directory);
[[nodiscard]] std::filesystem::path blobsDirectory(const std::filesystem::path &directory);

/// Held until the result is gone, however its program ends; null when another program has it.
[[nodiscard]] std::shared_ptr<const void> tryLock(const std::filesystem::path &file);

/// The file that the one server which serves a directory has locked: two would not know of each
/// other's writers.
[[nodiscard]] std::filesystem::path serversLock(const std::filesystem::path &directory);

} // namespace pelliko::server
