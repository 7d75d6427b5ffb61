#pragma once

#include "store/TableSession.h"

#include <filesystem>
#include <memory>

namespace pelliko::server
{

/// Opens a file that SqliteMetadata has made.
[[nodiscard]] std::unique_ptr<TableSession> openSqliteTables(const std::filesystem::path &file);

} // namespace pelliko::server
