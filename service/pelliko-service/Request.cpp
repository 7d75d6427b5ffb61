#include "Request.h"

#include <PhoneNumbers.h>
#include <glib.h>

#include <algorithm>
#include <utility>

namespace pelliko::service
{
namespace
{
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
    if (!numbersAreKnown()) {
        return;
    }
    waitsForNetwork_ = !context_.gate.open(account_.server, record_.wifiOnly);
    if (waitsForNetwork_) {
        g_message("request %d: waits for a network", record_.id);
        stuckSince_ = -1; // a missing network says nothing about the server
        pause();
    } else if (const int64_t rest = rest_.left(account_.server, context_.timers.steadyMs())) {
        retryAfter(rest);
    } else if (record_.share.empty()) {
        create();
    } else if (!record_.reshareOf.empty()) {
        askJoined();
    } else {
        askOffsets();
    }
}

bool Request::numbersAreKnown()
{
    if (findForms(record_.recipients, account_.number)) {
        if (!store([&] { context_.queue.setFindings(record_.id, record_.recipients); })) {
            return false;
        }
        for (size_t i = 0; i < record_.recipients.size(); ++i) {
            if (const std::string &fault = record_.recipients[i].fault; !fault.empty()) {
                g_warning("request %d: recipient %zu of %zu gets nothing: %s", record_.id, i + 1,
                          record_.recipients.size(), numbers::faultSentence(fault));
            }
        }
    }
    if (people(record_.recipients).empty()) {
        fail(failureNamed("no_recipient"));
        return false;
    }
    return true;
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
        maybeCreated_ = ShareApi::failureOf(answer).retry; // a refusal has made nothing
        fail(answer);
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
        fail(answer);
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
        askJoined();
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
    files_ = std::make_unique<FilesUpload>(context_.http, context_.timers, account_,
                                           std::move(files), context_.settings.chunkBytes);
    files_->start([this](int64_t bytes, bool stored) { onProgress(bytes, stored); },
                  [this](const Failure *failure, int64_t restMs) {
                      if (failure) {
                          fail(*failure, restMs);
                      } else {
                          askJoined();
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

// The share goes on without an answer: whoever is not known to have joined gets a message.
void Request::askJoined()
{
    auto numbers = askable(record_.recipients);
    if (asked_ || numbers.empty()) {
        finish();
        return;
    }
    question_ = std::make_unique<JoinedQuestion>(context_.http, context_.timers, account_);
    question_->ask(std::move(numbers),
                   [this](const JoinedFindings &findings) { onJoined(findings); });
}

void Request::onJoined(const JoinedFindings &findings)
{
    question_.reset();
    noteJoined(record_.recipients, findings.asked, findings.joined);
    if (!findings.asked.empty() &&
        !store([&] { context_.queue.setFindings(record_.id, record_.recipients); })) {
        return;
    }
    asked_ = findings.refused || findings.waitSeconds > 0 || askable(record_.recipients).empty();
    finish();
}

void Request::finish()
{
    send(ShareApi::finishShare(account_, record_.share), &Request::onFinished);
}

void Request::onFinished(const HttpAnswer &answer)
{
    if (!answer.failure.empty() || answer.status != 200) {
        fail(answer);
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

} // namespace pelliko::service
