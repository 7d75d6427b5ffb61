#include "store/PostgresClock.h"

#include "store/PostgresConnection.h"

namespace pelliko::server
{
namespace
{

constexpr std::int64_t second = 1'000'000;

} // namespace

std::int64_t PostgresClock::counted()
{
    using std::chrono::microseconds;
    return std::chrono::duration_cast<microseconds>(Counter::now().time_since_epoch()).count();
}

void PostgresClock::set(PostgresConnection &db)
{
    const std::int64_t before = counted();
    PostgresRows row =
        db.query("SELECT floor(extract(epoch FROM clock_timestamp()) * 1000000)::bigint");
    const std::int64_t after = counted();
    if (row.next())
        m_offset = row.integer(0) - (before + after) / 2;
}

Seconds PostgresClock::now() const
{
    return (counted() + m_offset) / second;
}

} // namespace pelliko::server
