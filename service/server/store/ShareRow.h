#pragma once

#include "store/Metadata.h"

namespace pelliko::server
{

/// A share's row with the parts that callers of a store do not see.
struct ShareRow {
    std::int64_t id = 0;
    /// As it was written last; the record's state is the one of the time asked for.
    ShareState stored = ShareState::uploading;
    ShareRecord record;
};

/// What a share is at `now`: one whose deadline has come is expired, swept or not.
[[nodiscard]] inline ShareState stateAt(ShareState stored, Seconds deadline, Seconds now)
{
    const bool live = stored == ShareState::uploading || stored == ShareState::finished;
    return live && deadline <= now ? ShareState::expired : stored;
}

/// The columns of a share's row, in the order in which each engine's shareRowOf reads them.
#define PELLIKO_SHARE_COLUMNS "s.id, s.key, s.state, s.created, s.deadline"

/// The state in which a push is kept.
enum class PushState {
    /// Has its plain token and is sent to every stream that opens.
    waiting = 0,
    acknowledged = 1,
    /// The share ended while it waited. A stream may have sent it just before.
    dropped = 2,
    /// Stays as a mark, so that finishing again makes no second one.
    forgotten = 3,
};

} // namespace pelliko::server
