#pragma once

#include "store/ShareRow.h"
#include "store/SqliteConnection.h"

namespace pelliko::server
{

/// The share of a row of PELLIKO_SHARE_COLUMNS, without files and recipients.
[[nodiscard]] ShareRow shareRowOf(const Query &row, Seconds now);

} // namespace pelliko::server
