#include "FilesUpload.h"

#include <algorithm>
#include <numeric>
#include <utility>

namespace pelliko::service
{
namespace
{
constexpr long smallAtATime = 4;
}

FilesUpload::FilesUpload(HttpSender &http, const Timers &timers, Account account,
                         std::vector<TusFile> files, int64_t chunkBytes)
    : http_(http), timers_(timers), account_(std::move(account)), files_(std::move(files)),
      chunkBytes_(chunkBytes)
{
    for (size_t index = 0; index < files_.size(); ++index) {
        present_.push_back(files_[index].offset);
        if (files_[index].offset < files_[index].stamp.size) {
            waiting_.push_back(index);
        }
    }
}

void FilesUpload::start(Progress progress, Done done)
{
    progress_ = std::move(progress);
    done_ = std::move(done);
    startMore();
}

// One that takes several appends.
bool FilesUpload::isLarge(size_t index) const
{
    return files_[index].stamp.size > AppendSize(chunkBytes_).bytes();
}

bool FilesUpload::mayStart(size_t index) const
{
    const auto large = std::count_if(running_.begin(), running_.end(),
                                     [this](const auto &entry) { return isLarge(entry.first); });
    const auto small = static_cast<long>(running_.size()) - large;
    return isLarge(index) ? large == 0 : small < smallAtATime;
}

void FilesUpload::startMore()
{
    const std::weak_ptr<bool> alive = alive_;
    for (;;) {
        const auto next = std::find_if(waiting_.begin(), waiting_.end(),
                                       [this](size_t index) { return mayStart(index); });
        if (next == waiting_.end()) {
            break;
        }
        const size_t index = *next;
        waiting_.erase(next);
        startFile(index);
        if (alive.expired()) {
            return;
        }
    }
    if (running_.empty() && waiting_.empty()) {
        finish(nullptr, 0);
    }
}

void FilesUpload::startFile(size_t index)
{
    auto upload = std::make_unique<TusUpload>(http_, timers_, account_, files_[index], chunkBytes_);
    TusUpload &started = *upload;
    running_[index] = std::move(upload);
    started.start(
        [this, index](int64_t present, bool stored) { onProgress(index, present, stored); },
        [this, index](const Failure *failure, int64_t restMs) {
            onFileDone(index, failure, restMs);
        });
}

void FilesUpload::onProgress(size_t index, int64_t present, bool stored)
{
    present_[index] = present;
    progress_(std::accumulate(present_.begin(), present_.end(), int64_t{0}), stored);
}

void FilesUpload::onFileDone(size_t index, const Failure *failure, int64_t restMs)
{
    running_.erase(index);
    if (failure) {
        finish(failure, restMs);
    } else {
        startMore();
    }
}

void FilesUpload::finish(const Failure *failure, int64_t restMs)
{
    running_.clear();
    waiting_.clear();
    // A second end cannot follow; the callback may destroy this.
    const Done done = std::exchange(done_, nullptr);
    if (done) {
        done(failure, restMs);
    }
}

} // namespace pelliko::service
