#pragma once

#include <chrono>
#include <mutex>

namespace pelliko::server
{

/// Growing distances between tries to reach a store that is away: meanwhile whoever wants something
/// of it is told at once instead of waiting for what will not come, but for one that tries.
/// Thread-safe.
class BackOff
{
public:
    using Duration = std::chrono::steady_clock::duration;

    /// The first distance; each is twice the one before, up to two seconds.
    explicit BackOff(Duration first) : m_first(first) {}

    /// False while nobody is to try. Who may tells what came of it.
    [[nodiscard]] bool mayTry();

    void reached();
    void missed();

    /// True after `missed`, until somebody has reached it.
    [[nodiscard]] bool isAway() const;

private:
    using Clock = std::chrono::steady_clock;

    const Duration m_first;
    mutable std::mutex m_mutex;
    Clock::time_point m_notBefore{};
    Duration m_distance{};
};

} // namespace pelliko::server
