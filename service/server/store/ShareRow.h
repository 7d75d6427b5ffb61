// What the engines that keep metadata have in common
#pragma once

#include "store/Metadata.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

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
[[nodiscard]] ShareState stateAt(ShareState stored, Seconds deadline, Seconds now);

/// The columns that shareRowOf reads, in its order.
#define PELLIKO_SHARE_COLUMNS "s.id, s.key, s.state, s.created, s.deadline"

/// The share of a row of PELLIKO_SHARE_COLUMNS, without files and recipients.
template <class Row> [[nodiscard]] ShareRow shareRowOf(const Row &row, Seconds now)
{
    ShareRow share;
    share.id = row.integer(0);
    share.record.key = row.text(1);
    share.record.created = row.integer(3);
    share.record.deadline = row.integer(4);
    share.stored = static_cast<ShareState>(row.integer(2));
    share.record.state = stateAt(share.stored, share.record.deadline, now);
    return share;
}

/// The columns and tables that uploadOf reads, and how an upload is found by its address.
#define PELLIKO_UPLOAD_COLUMNS                                                                     \
    PELLIKO_SHARE_COLUMNS ", f.name, f.type, f.size, coalesce(b.received, 0),"                     \
                          " f.upload, coalesce(b.key, '') FROM files f"                            \
                          " JOIN shares s ON s.id = f.share LEFT JOIN blobs b ON b.id = f.blob"

template <class Row> [[nodiscard]] UploadRecord uploadOf(const Row &row, Seconds now)
{
    const ShareRecord share = shareRowOf(row, now).record;
    return UploadRecord{
        share.key, share.state, share.deadline,
        FileRecord{row.text(5), row.text(6), row.size(7), row.size(8), row.text(9), row.text(10)}};
}

/// The state in which a push is kept; statements name them by number.
enum class PushState {
    /// Has its plain token and is sent to every stream that opens.
    waiting = 0,
    acknowledged = 1,
    /// The share ended while it waited. A stream may have sent it just before.
    dropped = 2,
    /// Stays as a mark, so that finishing again makes no second one.
    forgotten = 3,
};

/// The columns and tables of a received share, after PELLIKO_SHARE_COLUMNS its sender and push.
#define PELLIKO_RECEIVED                                                                           \
    PELLIKO_SHARE_COLUMNS ", a.number, p.id FROM pushes p"                                         \
                          " JOIN shares s ON s.id = p.share JOIN accounts a ON a.id = s.account"

/// Bounds what a stream holds of pushes in memory; it asks again for the rest.
inline constexpr int pushesAtOnce = 64;

/// True when bytes of one of its files are gone, though the share has not ended.
[[nodiscard]] bool hasLostFile(const ShareRecord &share);

/// All that a share's files are to have.
[[nodiscard]] std::uint64_t announcedBytes(const NewShare &share);

/// What an account has used of a limit, and when.
struct Use {
    Seconds at = 0;
    std::uint64_t amount = 0;
};

/// A limit within the time before `now` that a window is long.
struct UseLimit {
    std::uint64_t most = 0;
    Seconds window = 0;
    Seconds now = 0;
};

/// Seconds until so much more fits beside the uses within the window, which are given oldest first;
/// nothing when it fits now.
[[nodiscard]] std::optional<Seconds> waitForRoom(std::uint64_t wanted, const std::vector<Use> &uses,
                                                 const UseLimit &limit);

/// Makes the record that of a finished share and returns nothing, or why it cannot be finished.
[[nodiscard]] std::optional<FinishResult::Outcome> markFinished(ShareRecord &share,
                                                                Seconds deadline);

} // namespace pelliko::server
