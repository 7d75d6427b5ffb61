#include "ReceivedShares.h"

#include "ReceivedApi.h"
#include "ShareApi.h"
#include "pelliko_shares.h"

#include <glib.h>

#include <algorithm>
#include <utility>

namespace pelliko::service
{
namespace
{
// What has ended since it was asked for says so without the server.
ReceivedShare atTime(ReceivedShare share, int64_t now)
{
    if (share.details.state == ReceivedState::available && share.details.expires <= now) {
        share.details.state = ReceivedState::expired;
    }
    return share;
}
} // namespace

ReceivedShares::ReceivedShares(RequestContext &context, ReceivedJournal &journal,
                               std::function<void()> changed)
    : context_(context), journal_(journal), changed_(std::move(changed)),
      backoff_(context.settings.firstRetryMs, context.settings.longestRetryMs, context.random)
{
}

ReceivedShares::~ReceivedShares()
{
    for (const uint64_t question : questions_) {
        context_.http.cancel(question);
    }
    context_.http.cancel(transfer_);
    context_.timers.cancel(timer_);
}

std::vector<ReceivedShare> ReceivedShares::all()
{
    auto shares = journal_.all();
    for (ReceivedShare &share : shares) {
        share = atTime(std::move(share), context_.timers.epochSeconds());
    }
    return shares;
}

std::optional<ReceivedShare> ReceivedShares::known(const std::string &token)
{
    auto share = journal_.find(token);
    if (share) {
        share = atTime(std::move(*share), context_.timers.epochSeconds());
    }
    return share;
}

void ReceivedShares::get(const std::string &token, bool fresh, const Answer &answer)
{
    if (!isContentToken(token)) {
        answer(PELLIKO_SHARES_ERROR_NOT_FOUND, std::nullopt);
        return;
    }
    const auto share = known(token);
    // What has ended does not come back.
    if (share && (!fresh || share->details.state != ReceivedState::available)) {
        answer(0, share);
        return;
    }
    const auto account = context_.account();
    if (!account) {
        answer(PELLIKO_SHARES_ERROR_REFUSED, share);
    } else if (!context_.gate.open(account->server, false)) {
        answer(PELLIKO_SHARES_ERROR_UNREACHABLE, share);
    } else {
        ask(*account, token, answer);
    }
}

void ReceivedShares::ask(const Account &account, const std::string &token, const Answer &answer)
{
    const auto number = std::make_shared<uint64_t>(0);
    *number = context_.http.send(ReceivedApi::getShare(account, token), nullptr,
                                 [this, token, answer, number](const HttpAnswer &got) {
                                     questions_.erase(*number);
                                     const int error = take(token, got);
                                     answer(error, known(token));
                                 });
    questions_.insert(*number);
}

int ReceivedShares::take(const std::string &token, const HttpAnswer &answer)
{
    if (const auto details = ReceivedApi::readShare(answer)) {
        journal_.keep(token, *details, context_.timers.epochSeconds());
        changed_();
        return 0;
    }
    const Failure &failure = ShareApi::failureOf(answer);
    if (failure.name == "not_found") {
        return PELLIKO_SHARES_ERROR_NOT_FOUND;
    }
    return failure.retry ? PELLIKO_SHARES_ERROR_UNREACHABLE : PELLIKO_SHARES_ERROR_REFUSED;
}

int ReceivedShares::forget(const std::string &token)
{
    if (!isContentToken(token) || !journal_.find(token)) {
        return PELLIKO_SHARES_ERROR_NOT_FOUND;
    }
    journal_.forget(token, true);
    changed_();
    kick();
    return 0;
}

void ReceivedShares::kick()
{
    if (transfer_ == 0) {
        context_.timers.cancel(std::exchange(timer_, 0));
        forgetOnServer();
    }
}

void ReceivedShares::forgetOnServer()
{
    const auto tokens = journal_.toForgetOnServer();
    const auto account = tokens.empty() ? std::nullopt : context_.account();
    if (!account || !context_.gate.open(account->server, false)) {
        return;
    }
    if (const int64_t rest = rest_.left(account->server, context_.timers.steadyMs())) {
        kickAfter(rest);
        return;
    }
    transfer_ = context_.http.send(ReceivedApi::forgetShare(*account, tokens.front()), nullptr,
                                   [this, token = tokens.front()](const HttpAnswer &answer) {
                                       transfer_ = 0;
                                       onForgotten(token, answer);
                                   });
}

void ReceivedShares::onForgotten(const std::string &token, const HttpAnswer &answer)
{
    const bool good = answer.failure.empty() && answer.status == 204;
    try {
        if (good || !ShareApi::failureOf(answer).retry) {
            journal_.forgottenOnServer(token);
            backoff_.reset();
            forgetOnServer();
            return;
        }
    } catch (const std::exception &fault) {
        g_warning("received shares: the journal fails: %s", fault.what());
    }
    const int64_t rest = askedRest(answer);
    rest_.begin(rest, context_.timers.steadyMs());
    kickAfter(std::max(backoff_.next(), rest));
}

void ReceivedShares::kickAfter(int64_t milliseconds)
{
    timer_ = context_.timers.after(milliseconds, [this] {
        timer_ = 0;
        kick();
    });
}

} // namespace pelliko::service
