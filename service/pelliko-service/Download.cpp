#include "Download.h"

#include "ReceivedApi.h"
#include "SaveName.h"
#include "ServerRest.h"
#include "ShareApi.h"
#include "pelliko_shares.h"

#include <glib.h>

#include <algorithm>
#include <cerrno>
#include <unistd.h>
#include <utility>

namespace pelliko::service
{
namespace
{
constexpr int mostAttempts = 4; // without a byte more; the user waits before the screen
constexpr int64_t longestWaitMs = 8'000;
constexpr long rangeNotSatisfiable = 416;

// Hidden, and the same for the same file of the same share, so that it can be gone on with. The
// token opens the share and stays out of file names.
std::string partPath(const DownloadWish &wish, int index)
{
    const std::string text = wish.token + "/" + std::to_string(index);
    g_autofree char *sum = g_compute_checksum_for_string(G_CHECKSUM_SHA256, text.c_str(), -1);
    return wish.directory + "/.pelliko-" + std::string(sum, 24) + ".part";
}

int codeOfErrno()
{
    return errno == ENOSPC || errno == EDQUOT ? PELLIKO_SHARES_ERROR_NO_SPACE
                                              : PELLIKO_SHARES_ERROR_IO;
}
} // namespace

Download::Download(RequestContext &context, ReceivedShares &shares, std::set<std::string> &busy,
                   DownloadWish wish, Callbacks callbacks)
    : context_(context), shares_(shares), busy_(busy), wish_(std::move(wish)),
      callbacks_(std::move(callbacks)),
      backoff_(context.settings.firstRetryMs,
               std::min(context.settings.longestRetryMs, longestWaitMs), context.random),
      self_(std::make_shared<Download *>(this))
{
}

Download::~Download()
{
    leaveFile(true);
}

void Download::start()
{
    askShare(&Download::onShare);
}

void Download::askShare(void (Download::*then)(int, const std::optional<ReceivedShare> &))
{
    shares_.get(wish_.token, true,
                [weak = std::weak_ptr<Download *>(self_),
                 then](int error, const std::optional<ReceivedShare> &share) {
                    if (const auto self = weak.lock()) {
                        ((*self)->*then)(error, share);
                    }
                });
}

void Download::onShare(int error, const std::optional<ReceivedShare> &share)
{
    if (error == 0 && share) {
        error = choose(*share);
    }
    if (error == 0 && g_mkdir_with_parents(wish_.directory.c_str(), 0777) != 0) {
        error = codeOfErrno();
    }
    if (error != 0) {
        end(error);
    } else {
        nextFile();
    }
}

int Download::choose(const ReceivedShare &share)
{
    if (share.details.state != ReceivedState::available) {
        return share.details.state == ReceivedState::expired ? PELLIKO_SHARES_ERROR_EXPIRED
                                                             : PELLIKO_SHARES_ERROR_WITHDRAWN;
    }
    const auto &files = share.details.files;
    if (wish_.file >= static_cast<int>(files.size())) {
        return PELLIKO_SHARES_ERROR_INVALID_PARAMETER;
    }
    for (size_t i = 0; i < files.size(); ++i) {
        if (wish_.file < 0 || wish_.file == static_cast<int>(i)) {
            files_.emplace_back(static_cast<int>(i), files[i]);
            total_ += files[i].size;
        }
    }
    return 0;
}

void Download::nextFile()
{
    if (place_ == files_.size()) {
        end(0);
        return;
    }
    const std::string part = partPath(wish_, files_[place_].first);
    if (!busy_.insert(part).second) {
        end(PELLIKO_SHARES_ERROR_BUSY);
        return;
    }
    part_ = part;
    backoff_.reset();
    fetch();
}

void Download::fetch()
{
    from_ = sizeOfPart(part_);
    if (from_ > file().size) {
        from_ = 0;
    }
    report(from_);
    if (from_ == file().size && from_ > 0) {
        onWhole();
        return;
    }
    const auto account = context_.account();
    if (!account) {
        end(PELLIKO_SHARES_ERROR_REFUSED);
        return;
    }
    HttpRequest request = ReceivedApi::getFile(*account, wish_.token, files_[place_].first, from_);
    sink_ = std::make_shared<PartFile>(part_, from_, file().size);
    request.sink = sink_;
    transfer_ = context_.http.send(
        std::move(request), [this](int64_t bytes) { report(from_ + bytes); },
        [this](const HttpAnswer &answer) {
            transfer_ = 0;
            onFetched(answer);
        });
}

void Download::report(int64_t ofFile)
{
    callbacks_.progress({files_[place_].first, before_ + std::min(ofFile, file().size), total_});
}

void Download::onFetched(const HttpAnswer &answer)
{
    sink_.reset();
    if (answer.failure == "disk_full" || answer.failure == "disk_failed") {
        end(answer.failure == "disk_full" ? PELLIKO_SHARES_ERROR_NO_SPACE
                                          : PELLIKO_SHARES_ERROR_IO);
    } else if (answer.failure.empty() && (answer.status == 200 || answer.status == 206)) {
        onWhole();
    } else if (answer.failure.empty() && answer.status == rangeNotSatisfiable) {
        unlink(part_.c_str());
        onBroken(failureNamed("unexpected_answer"), 0);
    } else if (const Failure &failure = ShareApi::failureOf(answer); failure.retry) {
        onBroken(failure, askedRest(answer));
    } else {
        onRefused();
    }
}

void Download::onWhole()
{
    const std::string path = renameToFree(part_, wish_.directory, plainFileName(file().name));
    if (path.empty()) {
        end(codeOfErrno());
        return;
    }
    saved_.push_back(path);
    before_ += file().size;
    leaveFile(false);
    ++place_;
    nextFile();
}

void Download::onBroken(const Failure &failure, int64_t restMs)
{
    if (sizeOfPart(part_) > from_) {
        backoff_.reset();
    }
    // Nobody waits long before a screen; the wish is told again later.
    if (backoff_.attempts() >= mostAttempts || restMs > longestWaitMs) {
        g_message("download: given up for now: %s", failure.name.data());
        end(PELLIKO_SHARES_ERROR_UNREACHABLE);
        return;
    }
    timer_ = context_.timers.after(std::max(backoff_.next(), restMs), [this] {
        timer_ = 0;
        fetch();
    });
}

// The share says why.
void Download::onRefused()
{
    askShare(&Download::onEnded);
}

void Download::onEnded(int error, const std::optional<ReceivedShare> &share)
{
    if (error == 0 && share && share->details.state == ReceivedState::expired) {
        error = PELLIKO_SHARES_ERROR_EXPIRED;
    } else if (error == 0 && share && share->details.state == ReceivedState::withdrawn) {
        error = PELLIKO_SHARES_ERROR_WITHDRAWN;
    }
    end(error != 0 ? error : PELLIKO_SHARES_ERROR_REFUSED);
}

void Download::leaveFile(bool remove)
{
    context_.http.cancel(std::exchange(transfer_, 0));
    context_.timers.cancel(std::exchange(timer_, 0));
    if (sink_) {
        sink_->abandon(); // its thread may not have heard yet
        sink_.reset();
    }
    if (remove && !part_.empty()) {
        unlink(part_.c_str());
    }
    busy_.erase(part_);
    part_.clear();
}

void Download::end(int error)
{
    // Only what may succeed later is worth its room.
    leaveFile(error != PELLIKO_SHARES_ERROR_UNREACHABLE);
    const auto done = std::exchange(callbacks_.done, nullptr);
    const auto saved = saved_;
    done(error, saved);
}

} // namespace pelliko::service
