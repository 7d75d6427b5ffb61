#pragma once

#include <cstdint>
#include <string>

namespace pelliko::service
{

/** What can be set on the command line; the defaults are those of daily use. Times in milliseconds.
 */
struct Settings {
    std::string queueFile;                     ///< empty: the user's data directory
    std::string accountFile;                   ///< empty: the user's configuration directory
    int64_t firstRetryMs = 2'000;              ///< first wait after a failed transfer
    int64_t longestRetryMs = 300'000;          ///< the waits double up to this
    int64_t giveUpMs = 3LL * 24 * 3600 * 1000; ///< no success for so long ends a request
    int64_t chunkBytes = 256LL * 1024 * 1024;  ///< most bytes of one append
    int64_t sendRate = 0;                      ///< most bytes a second of one transfer, 0: no limit
    int64_t stallSeconds = 60;                 ///< so long without a byte ends a transfer
    int64_t firstLaunchRetryMs = 2'000;        ///< first wait after a failed launch
    int64_t longestLaunchRetryMs = 600'000;    ///< the waits double up to this
    int64_t claimMs = 30'000;                  ///< how long a resumed application may take to claim
    int64_t pushSilenceMs = 75'000;            ///< a silent push stream is taken to be dead
    int64_t graceMs = 3'000; ///< after a start: time for living clients to come back
};

} // namespace pelliko::service
