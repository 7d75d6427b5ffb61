#pragma once

#include "Backoff.h"
#include "FilesUpload.h"
#include "JoinedQuestion.h"
#include "ProgressReporter.h"
#include "RequestContext.h"
#include "ServerRest.h"
#include "SmsDelivery.h"

namespace pelliko::service
{

/** One share's way from the queue to its end: create, upload, finish, messages. It ends exactly
 * once. */
class Request
{
public:
    using Report = std::function<void(const RequestReport &)>;

    /**
     * @param fromEarlierRun whether the server may know of it although no name of a share is stored
     * @param report         receives the status reports, from the loop or from inside cancel();
     * after the last one the request may be destroyed, but not from inside
     */
    Request(RequestContext &context, QueuedRequest record, bool fromEarlierRun, Report report);
    ~Request();
    Request(const Request &) = delete;
    Request &operator=(const Request &) = delete;

    void start();
    void cancel();
    void networkChanged();

    const QueuedRequest &record() const { return record_; }
    bool ended() const { return ended_; }
    int percent() const { return progress_.percent(); }
    bool paused() const { return paused_; }

    /** What a client that begins to listen now has to know. */
    std::vector<RequestReport> present() const;

private:
    void proceed();
    bool numbersAreKnown();
    bool filesAreThere();
    void create();
    void onCreated(const HttpAnswer &answer);
    void askOffsets();
    void onOffsets(const HttpAnswer &answer);
    void takeRecord(const HttpAnswer &answer);
    void uploadFiles(const ShareRecord &share);
    void onProgress(int64_t present, bool stored);
    void askJoined();
    void onJoined(const JoinedFindings &findings);
    void finish();
    void onFinished(const HttpAnswer &answer);
    void tellRecipients();

    void send(HttpRequest request, void (Request::*done)(const HttpAnswer &));
    void begins();
    void pause();
    /** @param restMs how long the server asked to be left alone */
    void fail(const Failure &failure, int64_t restMs = 0);
    void fail(const HttpAnswer &answer);
    void retryLater(const Failure &failure);
    void retryAfter(int64_t milliseconds);
    void end(Status status, int error);
    bool storeEnd(Status status, int error);
    bool store(const std::function<void()> &change);
    void stopTransfers();
    void report(Status status, int percent = 0, int error = 0);
    std::string temporaryFile() const;

    RequestContext &context_;
    QueuedRequest record_;
    Report report_;
    Account account_;
    Backoff backoff_;
    ServerRest rest_;
    ProgressReporter progress_;
    std::unique_ptr<FilesUpload> files_;
    std::unique_ptr<JoinedQuestion> question_;
    std::unique_ptr<SmsDelivery> sms_;
    uint64_t transfer_ = 0;
    uint64_t retryTimer_ = 0;
    uint64_t endTimer_ = 0;
    int64_t stuckSince_ = -1;
    bool maybeCreated_;
    bool started_ = false;
    bool paused_ = false;
    bool asked_ = false; ///< the server has said who has joined, or that it does not
    bool waitsForNetwork_ = false;
    bool ended_ = false;
};

} // namespace pelliko::service
