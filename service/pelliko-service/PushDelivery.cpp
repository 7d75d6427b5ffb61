#include "PushDelivery.h"

#include "ReceivedApi.h"
#include "ShareApi.h"

#include <glib.h>

#include <algorithm>
#include <utility>

namespace pelliko::service
{
namespace
{
constexpr size_t mostTokens = 30; // of one launch; the others follow
// An application that ends each time before it confirms may have shown them each time.
constexpr int mostLaunches = 5;
} // namespace

PushDelivery::PushDelivery(RequestContext &context, ReceivedJournal &journal,
                           std::function<void()> changed)
    : context_(context), journal_(journal), changed_(std::move(changed)),
      backoff_(context.settings.firstRetryMs, context.settings.longestRetryMs, context.random),
      launchBackoff_(context.settings.firstLaunchRetryMs, context.settings.longestLaunchRetryMs,
                     context.random)
{
}

PushDelivery::~PushDelivery()
{
    context_.http.cancel(transfer_);
    context_.timers.cancel(timer_);
}

void PushDelivery::kick()
{
    if (transfer_ == 0 && !launching_) {
        context_.timers.cancel(std::exchange(timer_, 0));
        next();
    }
}

void PushDelivery::next()
{
    try {
        if (!askForUnread()) {
            launch();
        }
    } catch (const std::exception &fault) {
        g_warning("push: the journal fails: %s", fault.what());
        again(backoff_);
    }
}

// All that wait are read first, so that they go to the application together.
bool PushDelivery::askForUnread()
{
    const auto unread = journal_.unread();
    const auto account = unread.empty() ? std::nullopt : context_.account();
    if (!account || !context_.gate.open(account->server, false)) {
        return false; // a change of either comes here again
    }
    if (const int64_t rest = rest_.left(account->server, context_.timers.steadyMs())) {
        nextAfter(rest);
        return true;
    }
    transfer_ = context_.http.send(ReceivedApi::getShare(*account, unread.front()), nullptr,
                                   [this, token = unread.front()](const HttpAnswer &answer) {
                                       transfer_ = 0;
                                       onShare(token, answer);
                                   });
    return true;
}

void PushDelivery::onShare(const std::string &token, const HttpAnswer &answer)
{
    const auto details = ReceivedApi::readShare(answer);
    const Failure &failure = ShareApi::failureOf(answer);
    try {
        if (details) {
            journal_.setDetails(token, *details);
        } else if (failure.name == "not_found" || failure.name == "gone") {
            g_message("push: a share is gone before it was looked at");
            journal_.forget(token, false);
        } else {
            g_message("push: a share cannot be looked at: %s", failure.name.data());
            again(backoff_, askedRest(answer));
            return;
        }
    } catch (const std::exception &fault) {
        g_warning("push: the journal cannot be written: %s", fault.what());
        again(backoff_);
        return;
    }
    backoff_.reset();
    changed_();
    next();
}

void PushDelivery::launch()
{
    auto tokens = journal_.untold(mostTokens);
    if (tokens.empty()) {
        return;
    }
    const bool worn = std::any_of(tokens.begin(), tokens.end(),
                                  [](const auto &one) { return one.attempts >= mostLaunches; });
    if (worn) {
        std::erase_if(tokens, [](const auto &one) { return one.attempts < mostLaunches; });
        g_warning("push: the application never confirmed %zu received shares", tokens.size());
        journal_.setTold(tokens);
        next();
        return;
    }
    journal_.countLaunch(tokens, 1);
    std::vector<std::string> texts;
    texts.reserve(tokens.size());
    for (const auto &one : tokens) {
        texts.push_back(one.token);
    }
    g_message("push: the application is launched for %zu received shares", texts.size());
    launching_ = true;
    context_.launcher.launchPush(
        texts, [this, tokens, alive = std::weak_ptr<bool>(alive_)](LaunchResult result) {
            if (!alive.expired()) {
                launching_ = false;
                onLaunched(tokens, result);
            }
        });
}

void PushDelivery::onLaunched(const std::vector<ReceivedJournal::Untold> &tokens,
                              LaunchResult result)
{
    try {
        if (result == LaunchResult::received) {
            journal_.setTold(tokens);
            launchBackoff_.reset();
            next();
            return;
        }
        if (result == LaunchResult::notSent) {
            journal_.countLaunch(tokens, -1);
        }
    } catch (const std::exception &fault) {
        g_warning("push: the journal cannot be written: %s", fault.what());
    }
    again(launchBackoff_);
}

void PushDelivery::again(Backoff &backoff, int64_t restMs)
{
    rest_.begin(restMs, context_.timers.steadyMs());
    nextAfter(std::max(backoff.next(), restMs));
}

void PushDelivery::nextAfter(int64_t milliseconds)
{
    timer_ = context_.timers.after(milliseconds, [this] {
        timer_ = 0;
        next();
    });
}

} // namespace pelliko::service
