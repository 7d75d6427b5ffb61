#pragma once

#include "store/OpenStores.h"

#include <string>
#include <vector>

namespace pelliko::server
{

/// What `--from` or `--to` names: a data directory, or the addresses of metadata and blobs, of
/// which one may be absent. Throws std::invalid_argument with a sentence.
[[nodiscard]] StoreUrls placeOf(const std::vector<std::string> &words);

/// Moves data and returns the program's exit code: 0 when all is moved, `serversRun` when the rest
/// waits for the servers' end. Throws std::exception with a sentence.
int migrateCommand(const std::vector<std::string> &from, const std::vector<std::string> &to);

inline constexpr int serversRun = 2;

} // namespace pelliko::server
