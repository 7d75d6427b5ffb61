#pragma once

#include "store/TableSession.h"

#include <memory>
#include <string>

namespace pelliko::server
{

class PostgresConnection;

/// Connects to a database that PostgresMetadata has made.
[[nodiscard]] std::unique_ptr<TableSession> openPostgresTables(const std::string &url);

/// Of servers, as long as the result lives, or the session of `db`. Null or false when the data are
/// being moved.
[[nodiscard]] std::shared_ptr<const void> takePartInServing(const std::string &url);
[[nodiscard]] bool takePartInServing(PostgresConnection &db);

} // namespace pelliko::server
