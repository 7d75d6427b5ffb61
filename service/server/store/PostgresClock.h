#pragma once

#include "store/Metadata.h"

#include <atomic>
#include <chrono>

namespace pelliko::server
{

class PostgresConnection;

/// The database's time, so that all servers of one database agree on when a share ends, whatever
/// their own clocks say. Read from the database now and then and carried on by this machine's
/// counter in between, which nobody sets. Thread-safe.
class PostgresClock
{
public:
    /// Asks the database.
    void set(PostgresConnection &db);

    /// The database's seconds since the epoch.
    [[nodiscard]] Seconds now() const;

private:
    using Counter = std::chrono::steady_clock;
    [[nodiscard]] static std::int64_t counted();

    /// Microseconds between the counter and the database's time.
    std::atomic<std::int64_t> m_offset{0};
};

} // namespace pelliko::server
