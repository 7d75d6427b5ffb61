#include "Withdrawals.h"

#include <glib.h>

#include <algorithm>
#include <utility>

namespace pelliko::service
{

Withdrawals::Withdrawals(RequestContext &context, std::function<void()> changed)
    : context_(context), changed_(std::move(changed)),
      backoff_(context.settings.firstRetryMs, context.settings.longestRetryMs, context.random)
{
}

Withdrawals::~Withdrawals()
{
    context_.http.cancel(transfer_);
    context_.timers.cancel(timer_);
}

void Withdrawals::kick()
{
    if (transfer_ == 0) {
        context_.timers.cancel(std::exchange(timer_, 0));
        next();
    }
}

void Withdrawals::next()
{
    try {
        const auto ids = context_.queue.withdrawals();
        if (ids.empty()) {
            return;
        }
        current_ = ids.front();
        const auto account = context_.account();
        if (!account || !context_.gate.open(account->server, false)) {
            again();
            return;
        }
        if (const int64_t rest = rest_.left(account->server, context_.timers.steadyMs())) {
            nextAfter(rest);
            return;
        }
        const auto request = context_.queue.find(current_);
        if (request->share.empty()) {
            findShare(*account, *request);
        } else {
            withdraw(*account, request->share);
        }
    } catch (const std::exception &fault) {
        g_warning("withdrawal: the queue cannot be read: %s", fault.what());
        again();
    }
}

// The answer to creating the share was lost: asking with the same key names it, made or not.
void Withdrawals::findShare(const Account &account, const QueuedRequest &request)
{
    std::vector<AnnouncedFile> files;
    for (const QueuedFile &file : request.files) {
        files.push_back({file.path, file.stamp.size});
    }
    std::vector<Recipient> recipients = request.recipients;
    findForms(recipients, account.number);
    HttpRequest create =
        request.reshareOf.empty()
            ? ShareApi::createShare(account, request.key, files, recipients)
            : ShareApi::createReshare(account, request.key, request.reshareOf, recipients);
    transfer_ = context_.http.send(std::move(create), nullptr, [this](const HttpAnswer &answer) {
        transfer_ = 0;
        onFound(answer);
    });
}

void Withdrawals::onFound(const HttpAnswer &answer)
{
    const bool good = answer.failure.empty() && (answer.status == 200 || answer.status == 201);
    const auto share = good ? ShareApi::readShare(answer) : std::nullopt;
    if (share) {
        try {
            context_.queue.setShare(current_, share->share);
            next();
        } catch (const std::exception &fault) {
            g_warning("withdrawal: the queue cannot be written: %s", fault.what());
            again();
        }
    } else if (good || ShareApi::failureOf(answer).retry) {
        again(askedRest(answer));
    } else {
        done();
    }
}

void Withdrawals::withdraw(const Account &account, const std::string &share)
{
    transfer_ = context_.http.send(ShareApi::withdrawShare(account, share), nullptr,
                                   [this](const HttpAnswer &answer) {
                                       transfer_ = 0;
                                       onWithdrawn(answer);
                                   });
}

void Withdrawals::onWithdrawn(const HttpAnswer &answer)
{
    if ((answer.failure.empty() && answer.status == 204) || !ShareApi::failureOf(answer).retry) {
        done();
    } else {
        again(askedRest(answer));
    }
}

void Withdrawals::done()
{
    try {
        context_.queue.withdrawalDone(current_);
    } catch (const std::exception &fault) {
        g_warning("withdrawal: the queue cannot be written: %s", fault.what());
        again();
        return;
    }
    g_message("request %d: its share is off the server", current_);
    backoff_.reset();
    changed_();
    next();
}

void Withdrawals::again(int64_t restMs)
{
    rest_.begin(restMs, context_.timers.steadyMs());
    nextAfter(std::max(backoff_.next(), restMs));
}

void Withdrawals::nextAfter(int64_t milliseconds)
{
    timer_ = context_.timers.after(milliseconds, [this] {
        timer_ = 0;
        next();
    });
}

} // namespace pelliko::service
