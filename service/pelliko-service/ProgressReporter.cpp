#include "ProgressReporter.h"

#include <algorithm>
#include <utility>

namespace pelliko::service
{
namespace
{
constexpr int64_t intervalMs = 100;
}

ProgressReporter::ProgressReporter(Timers &timers, int64_t totalBytes,
                                   std::function<void(int)> report)
    : timers_(timers), totalBytes_(totalBytes), report_(std::move(report)),
      reportedAt_(timers.steadyMs() - intervalMs)
{
}

ProgressReporter::~ProgressReporter()
{
    stop();
}

void ProgressReporter::update(int64_t bytes)
{
    const auto part = totalBytes_ > 0 ? static_cast<long double>(bytes) * 100 /
                                            static_cast<long double>(totalBytes_)
                                      : 0;
    percent_ = std::clamp(static_cast<int>(part), 0, 100);
    if (percent_ == reported_ || timer_ != 0) {
        return;
    }
    const int64_t passed = timers_.steadyMs() - reportedAt_;
    if (passed >= intervalMs) {
        reportNow();
    } else {
        timer_ = timers_.after(intervalMs - passed, [this] {
            timer_ = 0;
            if (percent_ != reported_) {
                reportNow();
            }
        });
    }
}

void ProgressReporter::repeatNext()
{
    reported_ = -1;
    reportedAt_ = timers_.steadyMs() - intervalMs;
}

void ProgressReporter::stop()
{
    timers_.cancel(std::exchange(timer_, 0));
}

void ProgressReporter::reportNow()
{
    reported_ = percent_;
    reportedAt_ = timers_.steadyMs();
    report_(percent_);
}

} // namespace pelliko::service
