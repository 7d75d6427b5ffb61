#include "JoinedQuestion.h"

#include <glib.h>

#include <algorithm>
#include <utility>

namespace pelliko::service
{
namespace
{
constexpr size_t batchSize = 100; // the server answers no larger ones
// A share does not wait for it any longer; the recipients can be told without.
constexpr int64_t patienceMs = 10'000;
} // namespace

JoinedQuestion::JoinedQuestion(HttpSender &http, Timers &timers, Account account)
    : http_(http), timers_(timers), account_(std::move(account))
{
}

JoinedQuestion::~JoinedQuestion()
{
    http_.cancel(transfer_);
    timers_.cancel(timer_);
}

void JoinedQuestion::ask(std::vector<std::string> numbers, Done done)
{
    left_ = std::move(numbers);
    done_ = std::move(done);
    next();
}

void JoinedQuestion::next()
{
    if (left_.empty()) {
        finish();
        return;
    }
    const auto end = left_.begin() + static_cast<std::ptrdiff_t>(std::min(batchSize, left_.size()));
    batch_.assign(left_.begin(), end);
    left_.erase(left_.begin(), end);
    transfer_ = http_.send(ShareApi::askJoined(account_, batch_), nullptr,
                           [this](const HttpAnswer &answer) {
                               transfer_ = 0;
                               timers_.cancel(std::exchange(timer_, 0));
                               onAnswer(answer);
                           });
    timer_ = timers_.after(patienceMs, [this] {
        timer_ = 0;
        http_.cancel(std::exchange(transfer_, 0));
        g_message("who has joined is not known: the server does not answer");
        finish();
    });
}

void JoinedQuestion::onAnswer(const HttpAnswer &answer)
{
    const auto joined = ShareApi::readJoined(answer);
    if (!joined) {
        const Failure &failure = ShareApi::failureOf(answer);
        g_message("who has joined is not known: %s", failure.name.data());
        findings_.refused = answer.failure.empty() && answer.status >= 400 && answer.status < 500;
        findings_.waitSeconds = std::max<int64_t>(
            g_ascii_strtoll(answer.header("retry-after").c_str(), nullptr, 10), 0);
        finish();
        return;
    }
    findings_.asked.insert(batch_.begin(), batch_.end());
    findings_.joined.insert(joined->begin(), joined->end());
    next();
}

void JoinedQuestion::finish()
{
    const Done done = std::exchange(done_, nullptr);
    const JoinedFindings findings = std::move(findings_);
    done(findings);
}

} // namespace pelliko::service
