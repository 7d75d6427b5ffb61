#pragma once

#include <cstdint>
#include <functional>

namespace pelliko::service
{

/** Time as the service sees it; tests put their own in its place. */
class Timers
{
public:
    virtual ~Timers() = default;

    /** Calls the task once, from the main loop, after so many milliseconds. @return a number for
     * cancel(), not 0 */
    virtual uint64_t after(int64_t milliseconds, std::function<void()> task) = 0;

    /** Forgets a task; numbers that are 0 or have run are ignored. */
    virtual void cancel(uint64_t timer) = 0;

    /** Milliseconds of a clock that never goes back. */
    virtual int64_t steadyMs() const = 0;

    /** Seconds since the epoch. */
    virtual int64_t epochSeconds() const = 0;
};

/** Timers of the GLib main loop. */
class LoopTimers : public Timers
{
public:
    uint64_t after(int64_t milliseconds, std::function<void()> task) override;
    void cancel(uint64_t timer) override;
    int64_t steadyMs() const override;
    int64_t epochSeconds() const override;
};

} // namespace pelliko::service
