#pragma once

#include "Timers.h"

#include <functional>

namespace pelliko::service
{

/** Turns bytes into whole percents: each reported when it changed, at most ten in a second. */
class ProgressReporter
{
public:
    ProgressReporter(Timers &timers, int64_t totalBytes, std::function<void(int percent)> report);
    ~ProgressReporter();
    ProgressReporter(const ProgressReporter &) = delete;
    ProgressReporter &operator=(const ProgressReporter &) = delete;

    void update(int64_t bytes);
    /** Makes the next update report at once, even when the percent is the same. */
    void repeatNext();
    /** Drops a report that still waits for its turn. */
    void stop();
    int percent() const { return percent_; }

private:
    void reportNow();

    Timers &timers_;
    int64_t totalBytes_;
    std::function<void(int)> report_;
    int percent_ = 0;
    int reported_ = -1;
    int64_t reportedAt_;
    uint64_t timer_ = 0;
};

} // namespace pelliko::service
