#pragma once

#include "store/SqliteConnection.h"

#include <optional>
#include <string>

namespace pelliko::server
{

/// A share's row with the parts that callers do not see.
struct ShareRow {
    std::int64_t id = 0;
    /// As it was written last; the record's state is the one of the time asked for.
    ShareState stored = ShareState::uploading;
    ShareRecord record;
};

/// What a share is at `now`: one whose deadline has come is expired, swept or not.
[[nodiscard]] ShareState stateAt(ShareState stored, Seconds deadline, Seconds now);

/// The columns that shareRowOf reads, in its order.
#define PELLIKO_SHARE_COLUMNS "s.id, s.key, s.state, s.created, s.deadline"

/// The share of a row of PELLIKO_SHARE_COLUMNS, without files and recipients.
[[nodiscard]] ShareRow shareRowOf(const Query &row, Seconds now);

} // namespace pelliko::server
