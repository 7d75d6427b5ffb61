#include "Downloads.h"

#include "pelliko_shares.h"

#include <algorithm>
#include <utility>

namespace pelliko::service
{
namespace
{
constexpr int errorCancelled = -125;
}

Downloads::Downloads(RequestContext &context, ReceivedShares &shares, Progress progress)
    : context_(context), shares_(shares), progress_(std::move(progress))
{
}

Downloads::~Downloads()
{
    while (!entries_.empty()) {
        cancel(DownloadKey(entries_.begin()->first));
    }
}

void Downloads::start(const DownloadKey &key, const DownloadWish &wish, Done done)
{
    if (wish.directory.empty() || wish.directory.front() != '/' || wish.file < -1 ||
        entries_.count(key) != 0) {
        done(PELLIKO_SHARES_ERROR_INVALID_PARAMETER, {});
        return;
    }
    auto download = std::make_unique<Download>(
        context_, shares_, busy_, wish,
        Download::Callbacks{
            [this, key](const DownloadProgress &progress) { progress_(key, progress); },
            [this, key](int error, const std::vector<std::string> &paths) {
                finish(key, error, paths);
            }});
    Download &started = *download;
    entries_[key] = {std::move(download), std::move(done)};
    started.start();
}

void Downloads::finish(const DownloadKey &key, int error, const std::vector<std::string> &paths)
{
    const auto found = entries_.find(key);
    const Entry entry = std::move(found->second);
    entries_.erase(found);
    entry.done(error, paths);
}

void Downloads::cancel(const DownloadKey &key)
{
    const auto found = entries_.find(key);
    if (found != entries_.end()) {
        const auto saved = found->second.download->saved();
        finish(key, errorCancelled, saved);
    }
}

void Downloads::callerGone(const std::string &caller)
{
    std::vector<DownloadKey> gone;
    for (const auto &[key, entry] : entries_) {
        if (key.caller == caller) {
            gone.push_back(key);
        }
    }
    for (const DownloadKey &key : gone) {
        cancel(key);
    }
}

bool Downloads::has(const std::string &caller) const
{
    return std::any_of(entries_.begin(), entries_.end(),
                       [&caller](const auto &entry) { return entry.first.caller == caller; });
}

} // namespace pelliko::service
