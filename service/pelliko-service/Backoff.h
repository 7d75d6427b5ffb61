#pragma once

#include <cstdint>
#include <functional>

namespace pelliko::service
{

/** Waits that double up to a limit, each drawn from the upper half of its range so that clients
 * spread out. */
class Backoff
{
public:
    /** @param random gives a number from 0 up to, not including, 1 */
    Backoff(int64_t firstMs, int64_t longestMs, std::function<double()> random);

    int64_t next();
    void reset() { attempts_ = 0; }
    int attempts() const { return attempts_; }

private:
    int64_t firstMs_;
    int64_t longestMs_;
    std::function<double()> random_;
    int attempts_ = 0;
};

/** GLib's random numbers, for use outside tests. */
double randomFraction();

} // namespace pelliko::service
