#include "Backoff.h"

#include <glib.h>

#include <algorithm>
#include <cmath>
#include <utility>

namespace pelliko::service
{

Backoff::Backoff(int64_t firstMs, int64_t longestMs, std::function<double()> random)
    : firstMs_(firstMs), longestMs_(longestMs), random_(std::move(random))
{
}

int64_t Backoff::next()
{
    const double doubled = std::ldexp(static_cast<double>(firstMs_), std::min(attempts_, 40));
    const double wait = std::min(doubled, static_cast<double>(longestMs_));
    ++attempts_;
    return static_cast<int64_t>(wait / 2 + wait / 2 * random_());
}

double randomFraction()
{
    return g_random_double();
}

} // namespace pelliko::service
