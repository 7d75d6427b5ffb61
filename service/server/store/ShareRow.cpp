#include "store/ShareRow.h"

#include <algorithm>

namespace pelliko::server
{

// What the statements of the engines name by number.
static_assert(static_cast<int>(ShareState::uploading) == 0);
static_assert(static_cast<int>(ShareState::finished) == 1);
static_assert(static_cast<int>(PushState::waiting) == 0);
static_assert(static_cast<int>(PushState::acknowledged) == 1);
static_assert(static_cast<int>(PushState::forgotten) == 3);

ShareState stateAt(ShareState stored, Seconds deadline, Seconds now)
{
    const bool live = stored == ShareState::uploading || stored == ShareState::finished;
    return live && deadline <= now ? ShareState::expired : stored;
}

bool hasLostFile(const ShareRecord &share)
{
    return std::any_of(share.files.begin(), share.files.end(),
                       [&](const FileRecord &file) { return share.lost(file); });
}

std::uint64_t announcedBytes(const NewShare &share)
{
    std::uint64_t sum = 0;
    for (const NewFile &file : share.files)
        sum += file.size;
    return sum;
}

std::optional<Seconds> waitForRoom(std::uint64_t wanted, const std::vector<Use> &uses,
                                   const UseLimit &limit)
{
    std::uint64_t used = wanted;
    for (const Use &use : uses)
        used += use.amount;
    if (used <= limit.most)
        return std::nullopt;
    for (const Use &use : uses) {
        used -= use.amount;
        if (used <= limit.most)
            return use.at + limit.window - limit.now;
    }
    return limit.window;
}

std::optional<FinishResult::Outcome> markFinished(ShareRecord &share, Seconds deadline)
{
    const bool first = share.state == ShareState::uploading;
    if (!first && share.state != ShareState::finished)
        return FinishResult::Outcome::gone;
    if (!std::all_of(share.files.begin(), share.files.end(),
                     [](const FileRecord &file) { return file.complete(); }))
        return FinishResult::Outcome::incomplete;
    if (first)
        share.deadline = deadline;
    share.state = ShareState::finished;
    return std::nullopt;
}

} // namespace pelliko::server
