#include "ResumeLauncher.h"

#include <glib.h>

#include <algorithm>
#include <utility>

namespace pelliko::service
{
namespace
{
constexpr int mostMissedClaims = 2;
}

ResumeLauncher::ResumeLauncher(RequestContext &context, Orphans &requests)
    : context_(context), requests_(requests),
      backoff_(context.settings.firstLaunchRetryMs, context.settings.longestLaunchRetryMs,
               context.random)
{
}

ResumeLauncher::~ResumeLauncher()
{
    context_.timers.cancel(timer_);
}

void ResumeLauncher::lookAfter(int64_t milliseconds)
{
    if (step_ != Step::idle) {
        return; // a look follows anyway
    }
    step_ = Step::waiting;
    timer_ = context_.timers.after(milliseconds, [this] { look(); });
}

void ResumeLauncher::look()
{
    timer_ = 0;
    asked_ = requests_.orphans();
    if (asked_.empty()) {
        step_ = Step::idle;
        backoff_.reset();
        missedClaims_.clear();
        return;
    }
    // Those of the last launch are well: what this one is for has nothing to do with it.
    const bool newOnes = std::none_of(asked_.begin(), asked_.end(),
                                      [this](int32_t id) { return launchedFor_.count(id) != 0; });
    if (newOnes) {
        backoff_.reset();
    }
    launchedFor_ = {asked_.begin(), asked_.end()};
    g_message("the application is launched to take %zu requests over", asked_.size());
    step_ = Step::launched;
    context_.launcher.launchResume(asked_, [this, alive = std::weak_ptr<bool>(alive_)](bool taken) {
        if (!alive.expired()) {
            onAnswer(taken);
        }
    });
}

void ResumeLauncher::onAnswer(bool taken)
{
    if (step_ != Step::launched) {
        return;
    }
    if (!taken) {
        again();
        return;
    }
    step_ = Step::claiming;
    timer_ = context_.timers.after(context_.settings.claimMs, [this] { onClaimTime(); });
}

void ResumeLauncher::onClaimTime()
{
    timer_ = 0;
    for (const int32_t id : std::exchange(asked_, {})) {
        if (requests_.isOrphan(id)) {
            requests_.abandon(id);
        }
    }
    step_ = Step::idle;
    backoff_.reset();
    lookAfter(0); // others may have lost their listener meanwhile
}

// One that ends while the next look is waited for was there for something else, such as the
// messages of a share: that says nothing about how often to ask.
void ResumeLauncher::applicationGone()
{
    if (step_ == Step::claiming) {
        onEndedWithoutClaim();
    }
}

// It may have answered and then crashed: it is asked once more before its requests are given up.
void ResumeLauncher::onEndedWithoutClaim()
{
    context_.timers.cancel(std::exchange(timer_, 0));
    for (const int32_t id : std::exchange(asked_, {})) {
        if (requests_.isOrphan(id) && ++missedClaims_[id] >= mostMissedClaims) {
            requests_.abandon(id);
        }
    }
    again();
}

void ResumeLauncher::again()
{
    step_ = Step::idle;
    lookAfter(backoff_.next());
}

void ResumeLauncher::claimed(int32_t id)
{
    // Ending later is another matter than never claiming.
    std::erase(asked_, id);
    missedClaims_.erase(id);
}

} // namespace pelliko::service
