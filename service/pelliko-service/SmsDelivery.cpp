#include "SmsDelivery.h"

#include <glib.h>

#include <utility>

namespace pelliko::service
{
namespace
{
// An application that ends each time before it answers is broken: it is not started for ever.
constexpr int mostLaunches = 5;
} // namespace

SmsDelivery::SmsDelivery(RequestContext &context, QueuedRequest &request)
    : context_(context), request_(request),
      backoff_(context.settings.firstLaunchRetryMs, context.settings.longestLaunchRetryMs,
               context.random)
{
}

SmsDelivery::~SmsDelivery()
{
    context_.timers.cancel(timer_);
}

void SmsDelivery::start(std::function<void(bool)> done)
{
    done_ = std::move(done);
    if (request_.smsState == SmsState::launching) {
        g_message("request %d: no answer to the launch is known, it is repeated", request_.id);
    }
    timer_ = context_.timers.after(0, [this] { launch(); });
}

void SmsDelivery::launch()
{
    timer_ = 0;
    if (context_.timers.epochSeconds() >= request_.expires) {
        giveUp("the share has expired");
        return;
    }
    if (request_.smsAttempts >= mostLaunches) {
        giveUp("the application never settled them");
        return;
    }
    const auto account = context_.account();
    if (!account || !store(SmsState::launching, request_.smsAttempts + 1)) {
        again([this] { launch(); });
        return;
    }
    const SmsLaunch data{request_.id,        request_.key,
                         request_.url,       account->number,
                         request_.expires,   static_cast<int>(request_.files.size()),
                         request_.smsNumbers};
    context_.launcher.launchSms(data,
                                [this, alive = std::weak_ptr<bool>(alive_)](LaunchResult result) {
                                    if (!alive.expired()) {
                                        onResult(result);
                                    }
                                });
}

void SmsDelivery::onResult(LaunchResult result)
{
    if (result == LaunchResult::received) {
        onReceived();
        return;
    }
    if (result == LaunchResult::notSent) {
        store(SmsState::wanted, request_.smsAttempts - 1);
    }
    g_message("request %d: the launch %s, it is repeated later", request_.id,
              result == LaunchResult::notSent ? "was not possible" : "was not confirmed");
    again([this] { launch(); });
}

void SmsDelivery::onReceived()
{
    if (!store(SmsState::delivered, 0)) {
        again([this] { onReceived(); });
        return;
    }
    const auto done = std::exchange(done_, nullptr);
    done(true);
}

bool SmsDelivery::store(SmsState state, int attempts)
{
    try {
        context_.queue.setSms(request_.id, state, attempts);
    } catch (const std::exception &fault) {
        g_warning("request %d: the queue cannot be written: %s", request_.id, fault.what());
        return false;
    }
    request_.smsState = state;
    request_.smsAttempts = attempts;
    return true;
}

void SmsDelivery::again(std::function<void()> step)
{
    timer_ = context_.timers.after(backoff_.next(), std::move(step));
}

void SmsDelivery::giveUp(const char *reason)
{
    g_warning("request %d: the recipients cannot be told: %s", request_.id, reason);
    const auto done = std::exchange(done_, nullptr);
    done(false);
}

} // namespace pelliko::service
