#pragma once

#include <chrono>
#include <cstdint>
#include <mutex>
#include <string>

namespace pelliko::server
{

/// Tells on standard error how far a long piece of work is: in place on a terminal, else a line now
/// and then. Thread-safe.
class Progress
{
public:
    /// `what` is being done to so many things with so many bytes in all.
    Progress(std::string what, std::uint64_t things, std::uint64_t bytes);
    /// Ends the line.
    ~Progress();
    Progress(const Progress &) = delete;
    Progress &operator=(const Progress &) = delete;

    void addBytes(std::uint64_t count);
    void addThings(std::uint64_t count);

private:
    void tell();

    using Clock = std::chrono::steady_clock;
    const std::string m_what;
    const std::uint64_t m_allThings;
    const std::uint64_t m_allBytes;
    const bool m_inPlace;
    std::mutex m_mutex;
    std::uint64_t m_things = 0;
    std::uint64_t m_bytes = 0;
    Clock::time_point m_next;
    bool m_told = false;
};

} // namespace pelliko::server
