#include "store/BackOff.h"

#include <algorithm>

namespace pelliko::server
{
namespace
{

constexpr std::chrono::seconds longest{2};

} // namespace

bool BackOff::mayTry()
{
    const std::lock_guard lock(m_mutex);
    const auto now = Clock::now();
    if (now < m_notBefore)
        return false;
    // Whoever comes while this one tries is told at once instead of waiting as well.
    if (m_distance > Duration::zero())
        m_notBefore = now + m_distance;
    return true;
}

void BackOff::reached()
{
    const std::lock_guard lock(m_mutex);
    m_distance = Duration::zero();
    m_notBefore = {};
}

void BackOff::missed()
{
    const std::lock_guard lock(m_mutex);
    m_distance = std::clamp<Duration>(2 * m_distance, m_first, longest);
    m_notBefore = Clock::now() + m_distance;
}

bool BackOff::isAway() const
{
    const std::lock_guard lock(m_mutex);
    return m_distance > Duration::zero();
}

} // namespace pelliko::server
