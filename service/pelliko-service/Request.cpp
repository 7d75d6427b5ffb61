#include "Request.h"

#include <glib.h>

#include <algorithm>
#include <utility>

namespace pelliko::service
{
namespace
{
constexpr const char *sharedDataFolder = "/opt/usr/apps/com.velmora.pelliko/shared/data/";
constexpr int64_t endRetryMs = 5'000;

int64_t totalSize(const std::vector<QueuedFile> &files)
{
    int64_t total = 0;
    for (const QueuedFile &file : files) {
        total += std::max<int64_t>(file.stamp.size, 0);
    }
    return total;
}
} // namespace

Request::Request(RequestContext &context, QueuedRequest record, bool fromEarlierRun, Report report)
    : context_(context), record_(std::move(record)), report_(std::move(report)),
      backoff_(context.settings.firstRetryMs, context.settings.longestRetryMs, context.random),
      progress_(context.timers, totalSize(record_.files),
                [this](int percent) { this->report(Status::progressing, percent); }),
      maybeCreated_(fromEarlierRun)
{
}

Request::~Request()
{
    stopTransfers();
    context_.timers.cancel(endTimer_);
}

void Request::start()
{
    if (ended_) {
        return;
    }
    if (record_.state == RequestState::notifying) {
        started_ = true;
        tellRecipients();
    } else {
        proceed();
    }
}

void Request::cancel()
{
    if (!ended_) {
        end(Status::cancelled, 0);
    }
}

void Request::networkChanged()
{
    const bool resting = ended_ || endTimer_ != 0 || record_.state != RequestState::uploading;
    if (resting || account_.server.empty()) {
        return;
    }
    const bool open = context_.gate.open(account_.server, record_.wifiOnly);
    if (open == waitsForNetwork_) {
        proceed();
    }
}

// Takes the next step from what is known; also the way back after every wait.
void Request::proceed()
{
    stopTransfers();
    const auto account = context_.account();
    if (!account) {
        fail(failureNamed("no_account"));
        return;
    }
    account_ = *account;
    waitsForNetwork_ = !context_.gate.open(account_.server, record_.wifiOnly);
    if (waitsForNetwork_) {
        g_message("request %d: waits for a network", record_.id);
        stuckSince_ = -1; // a missing network says nothing about the server
        pause();
    } else if (record_.share.empty()) {
        create();
    } else if (!record_.reshareOf.empty()) {
        finish();
    } else {
        askOffsets();
    }
}

bool Request::filesAreThere()
{
    for (const QueuedFile &file : record_.files) {
        std::string failure = "file_vanished";
        if (file.stamp.size < 0 || !SourceFile::open(file.path, file.stamp, failure)) {
            g_warning("request %d: %s: %s", record_.id, failure.c_str(), file.path.c_str());
            fail(failureNamed(failure));
            return false;
        }
    }
    return true;
}

void Request::create()
{
    if (!record_.reshareOf.empty()) {
        send(ShareApi::createReshare(account_, record_.key, record_.reshareOf, record_.recipients),
             &Request::onCreated);
    } else if (filesAreThere()) {
        std::vector<AnnouncedFile> files;
        for (const QueuedFile &file : record_.files) {
            files.push_back({file.path, file.stamp.size});
        }
        send(ShareApi::createShare(account_, record_.key, files, record_.recipients),
             &Request::onCreated);
    }
    maybeCreated_ = true;
}

void Request::onCreated(const HttpAnswer &answer)
{
    if (!answer.failure.empty() || (answer.status != 201 && answer.status != 200)) {
        const Failure &failure = ShareApi::failureOf(answer);
        maybeCreated_ = failure.retry; // a refusal has made nothing
        fail(failure);
        return;
    }
    takeRecord(answer);
}

void Request::askOffsets()
{
    send(ShareApi::getShare(account_, record_.share), &Request::onOffsets);
}

void Request::onOffsets(const HttpAnswer &answer)
{
    if (!answer.failure.empty() || answer.status != 200) {
        fail(ShareApi::failureOf(answer));
    } else {
        takeRecord(answer);
    }
}

void Request::takeRecord(const HttpAnswer &answer)
{
    const auto share = ShareApi::readShare(answer);
    if (!share) {
        fail(failureNamed("unexpected_answer"));
        return;
    }
    if (record_.share != share->share) {
        if (!store([&] { context_.queue.setShare(record_.id, share->share); })) {
            return;
        }
        record_.share = share->share;
        backoff_.reset();
    }
    begins();
    if (record_.reshareOf.empty()) {
        uploadFiles(*share);
    } else {
        finish();
    }
}

void Request::uploadFiles(const ShareRecord &share)
{
    if (share.files.size() != record_.files.size()) {
        fail(failureNamed("unexpected_answer"));
        return;
    }
    std::vector<TusFile> files;
    int64_t present = 0;
    for (size_t i = 0; i < share.files.size(); ++i) {
        files.push_back({record_.files[i].path, record_.files[i].stamp, share.files[i].upload,
                         std::min(share.files[i].offset, record_.files[i].stamp.size)});
        present += files.back().offset;
    }
    if (!paused_) {
        progress_.update(present);
    }
    files_ = std::make_unique<FilesUpload>(context_.http, account_, std::move(files),
                                           context_.settings.chunkBytes);
    files_->start([this](int64_t bytes, bool stored) { onProgress(bytes, stored); },
                  [this](const Failure *failure) {
                      if (failure) {
                          fail(*failure);
                      } else {
                          finish();
                      }
                  });
}

void Request::onProgress(int64_t present, bool stored)
{
    if (stored) {
        backoff_.reset();
        stuckSince_ = -1;
    }
    if (std::exchange(paused_, false)) {
        progress_.repeatNext();
    }
    progress_.update(present);
}

void Request::finish()
{
    send(ShareApi::finishShare(account_, record_.share), &Request::onFinished);
}

void Request::onFinished(const HttpAnswer &answer)
{
    if (!answer.failure.empty() || answer.status != 200) {
        fail(ShareApi::failureOf(answer));
        return;
    }
    const auto finished = ShareApi::readFinished(answer);
    if (!finished) {
        fail(failureNamed("unexpected_answer"));
        return;
    }
    if (!store([&] { context_.queue.setFinished(record_.id, *finished); })) {
        return;
    }
    record_.state = RequestState::notifying;
    record_.url = finished->url;
    record_.expires = finished->expires;
    record_.smsNumbers = finished->sms;
    record_.smsState = finished->sms.empty() ? SmsState::none : SmsState::wanted;
    stopTransfers();
    begins();
    paused_ = false;
    report(Status::finished, 100);
    tellRecipients();
}

void Request::tellRecipients()
{
    if (record_.smsState == SmsState::none || record_.smsState == SmsState::delivered) {
        end(Status::shareFinished, 0);
        return;
    }
    sms_ = std::make_unique<SmsDelivery>(context_, record_);
    sms_->start([this](bool received) {
        if (received) {
            end(Status::shareFinished, 0);
        } else {
            fail(failureNamed("launch_failed"));
        }
    });
}

void Request::send(HttpRequest request, void (Request::*done)(const HttpAnswer &))
{
    transfer_ =
        context_.http.send(std::move(request), nullptr, [this, done](const HttpAnswer &answer) {
            transfer_ = 0;
            (this->*done)(answer);
        });
}

void Request::begins()
{
    if (!std::exchange(started_, true)) {
        report(Status::started);
    }
}

void Request::pause()
{
    if (!std::exchange(paused_, true)) {
        report(Status::paused, progress_.percent());
    }
}

void Request::fail(const Failure &failure)
{
    stopTransfers();
    g_message("request %d: %s", record_.id, failure.name.data());
    if (failure.retry) {
        retryLater(failure);
    } else {
        end(Status::failed, failure.code);
    }
}

void Request::retryLater(const Failure &failure)
{
    const int64_t now = context_.timers.steadyMs();
    if (stuckSince_ < 0) {
        stuckSince_ = now;
    }
    if (now - stuckSince_ >= context_.settings.giveUpMs) {
        end(Status::failed, failure.code);
        return;
    }
    const int64_t wait = backoff_.next();
    if (backoff_.attempts() > 1) {
        pause();
    }
    retryTimer_ = context_.timers.after(wait, [this] {
        retryTimer_ = 0;
        proceed();
    });
}

void Request::end(Status status, int error)
{
    stopTransfers();
    sms_.reset();
    if (!storeEnd(status, error)) {
        // The end is told when it is on disk, or a restart would make a second one.
        context_.timers.cancel(endTimer_);
        endTimer_ = context_.timers.after(endRetryMs, [this, status, error] {
            endTimer_ = 0;
            end(status, error);
        });
        return;
    }
    context_.timers.cancel(std::exchange(endTimer_, 0));
    ended_ = true;
    record_.state = RequestState::ended;
    record_.endStatus = static_cast<int>(status);
    record_.error = error;
    report(status, 0, error);
}

bool Request::storeEnd(Status status, int error)
{
    const bool withdraw =
        status != Status::shareFinished && (maybeCreated_ || !record_.share.empty());
    try {
        context_.queue.setEnded(record_.id, static_cast<int>(status), error, withdraw,
                                context_.timers.epochSeconds());
        return true;
    } catch (const std::exception &fault) {
        g_warning("request %d: the queue cannot be written: %s", record_.id, fault.what());
        return false;
    }
}

bool Request::store(const std::function<void()> &change)
{
    try {
        change();
        return true;
    } catch (const std::exception &fault) {
        g_warning("request %d: the queue cannot be written: %s", record_.id, fault.what());
        fail(failureNamed("queue_failed"));
        return false;
    }
}

void Request::stopTransfers()
{
    context_.http.cancel(std::exchange(transfer_, 0));
    context_.timers.cancel(std::exchange(retryTimer_, 0));
    files_.reset();
    progress_.stop();
}

void Request::report(Status status, int percent, int error)
{
    RequestReport report{status, {}, percent, record_.expires, error};
    if (status == Status::shareFinished) {
        report.input = temporaryFile();
    }
    report_(report);
}

// The application makes a file there for a text or a contact that is shared; only it may remove it.
std::string Request::temporaryFile() const
{
    const bool own = record_.reshareOf.empty() && record_.files.size() == 1 &&
                     g_str_has_prefix(record_.files[0].path.c_str(), sharedDataFolder);
    return own ? record_.files[0].path : std::string();
}

std::vector<RequestReport> Request::present() const
{
    if (record_.state == RequestState::notifying) {
        return {{Status::finished, {}, 100, record_.expires, 0}};
    }
    std::vector<RequestReport> reports;
    if (started_) {
        reports.push_back({Status::started, {}, 0, 0, 0});
        reports.push_back({Status::progressing, {}, progress_.percent(), 0, 0});
    }
    if (paused_) {
        reports.push_back({Status::paused, {}, progress_.percent(), 0, 0});
    }
    return reports;
}

} // namespace pelliko::service
