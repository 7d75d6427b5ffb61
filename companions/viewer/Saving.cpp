#include "Saving.h"

#include <algorithm>
#include <utility>

namespace pelliko::viewer
{

using Kind = FileState::Kind;

Saving::Saving(std::string token, const std::vector<companion::ShareFile> &files,
               std::string folder, std::function<void()> changed)
    : token_(std::move(token)), folder_(std::move(folder)), changed_(std::move(changed)),
      files_(files.size())
{
    for (const companion::ShareFile &file : files)
        sizes_.push_back(file.size);
}

Saving::~Saving()
{
    pelliko_shares_stop(call_);
}

void Saving::save(size_t index)
{
    enqueue(index);
    startNext();
}

void Saving::saveAll()
{
    for (size_t i = 0; i < files_.size(); ++i)
        enqueue(i);
    startNext();
}

void Saving::enqueue(size_t index)
{
    if (index >= files_.size() || files_[index].kind != Kind::notSaved)
        return;
    if (!running_ && queue_.empty()) {
        fault_ = 0;
        roundBytes_ = roundDone_ = 0;
        roundSaved_ = roundCount_ = 0;
    }
    files_[index].kind = Kind::waiting;
    queue_.push_back(index);
    roundBytes_ += sizes_[index];
    roundCount_ += 1;
}

void Saving::startNext()
{
    if (!running_ && !queue_.empty()) {
        current_ = queue_.front();
        queue_.pop_front();
        running_ = true;
        files_[current_].kind = Kind::saving;
        files_[current_].done = 0;
        const int fault =
            pelliko_shares_download(token_.c_str(), static_cast<int>(current_), folder_.c_str(),
                                    onProgress, onDone, this, &call_);
        if (fault != 0)
            stopWith(fault);
    }
    changed_();
}

void Saving::onProgress(int, int64_t done, int64_t, void *data)
{
    auto *saving = static_cast<Saving *>(data);
    saving->files_[saving->current_].done = done;
    saving->changed_();
}

void Saving::onDone(int result, const char *const *paths, int count, void *data)
{
    static_cast<Saving *>(data)->finished(result, count > 0 ? paths[0] : nullptr);
}

void Saving::finished(int result, const char *path)
{
    call_ = 0;
    if (result != 0 || !path) {
        stopWith(result != 0 ? result : PELLIKO_SHARES_ERROR_IO);
        changed_();
        return;
    }
    running_ = false;
    files_[current_] = {Kind::saved, sizes_[current_], path};
    roundDone_ += sizes_[current_];
    roundSaved_ += 1;
    startNext();
}

// What stopped one file would stop the next ones too.
void Saving::stopWith(int fault)
{
    running_ = false;
    call_ = 0;
    fault_ = fault;
    queue_.clear();
    for (FileState &file : files_) {
        if (file.kind != Kind::saved)
            file = {};
    }
}

void Saving::cancel()
{
    if (!running_)
        return;
    pelliko_shares_stop(call_);
    stopWith(0);
    changed_();
}

size_t Saving::savedCount() const
{
    return static_cast<size_t>(
        std::count_if(files_.begin(), files_.end(),
                      [](const FileState &file) { return file.kind == Kind::saved; }));
}

bool Saving::allSaved() const
{
    return savedCount() == files_.size();
}

double Saving::progress() const
{
    const int64_t done = roundDone_ + (running_ ? files_[current_].done : 0);
    if (roundBytes_ <= 0)
        return running_ ? 0.0 : 1.0;
    return std::clamp(static_cast<double>(done) / static_cast<double>(roundBytes_), 0.0, 1.0);
}

} // namespace pelliko::viewer
