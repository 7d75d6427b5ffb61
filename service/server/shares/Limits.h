#pragma once

#include <cstddef>
#include <cstdint>

namespace pelliko::server
{

/// What an account may do and how long things are kept. Bytes and seconds.
struct Limits {
    std::size_t filesPerShare = 100;
    std::size_t recipientsPerShare = 100;
    std::uint64_t shareBytes = std::uint64_t{1} << 30;
    std::uint64_t dailyBytes = std::uint64_t{2} << 30;
    std::int64_t dailyWindow = 86400;
    /// Numbers in one question about who has joined, and in all questions of an account within
    /// the daily window. Numbers of one country are tens of millions: asking for all takes decades.
    std::size_t numbersPerQuestion = 100;
    std::uint64_t dailyNumbers = 2000;
    /// From the finish to the end of the link.
    std::int64_t shareLifetime = 2 * 86400;
    /// From making a share to giving it up when it is not finished.
    std::int64_t unfinishedLifetime = 7 * 86400;
    /// From the end of a share to the moment when its names and numbers are forgotten.
    std::int64_t endedKept = 30 * 86400;
    /// Attempts to register from one address within the window.
    std::size_t registrations = 20;
    std::int64_t registrationWindow = 3600;
    /// Open push streams, in all and of one account, and the seconds between their signs of life.
    std::size_t pushStreams = 10000;
    std::size_t pushStreamsPerAccount = 8;
    std::int64_t pushKeepAlive = 25;
};

} // namespace pelliko::server
