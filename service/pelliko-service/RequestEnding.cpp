// What a request tells, how it waits, and how it ends; the steps of its way are in Request.cpp.
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
} // namespace

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

void Request::fail(const HttpAnswer &answer)
{
    fail(ShareApi::failureOf(answer), askedRest(answer));
}

void Request::fail(const Failure &failure, int64_t restMs)
{
    stopTransfers();
    rest_.begin(restMs, context_.timers.steadyMs());
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
    const int64_t own = backoff_.next();
    const int64_t rest = rest_.left(account_.server, now);
    if (backoff_.attempts() > 1 || rest > context_.settings.firstRetryMs) {
        pause();
    }
    retryAfter(std::max(own, rest));
}

void Request::retryAfter(int64_t milliseconds)
{
    retryTimer_ = context_.timers.after(milliseconds, [this] {
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
    question_.reset();
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
