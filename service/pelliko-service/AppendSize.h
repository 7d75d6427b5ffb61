#pragma once

#include <cstdint>

namespace pelliko::service
{

/**
 * How many bytes of a file the next append brings. Every append ends with a wait for the server's
 * disk, so on a fast way to the server long ones save time; on a slow one short ones are confirmed
 * more often.
 */
class AppendSize
{
public:
    /** What every upload begins with, where that is allowed. */
    static constexpr int64_t first = 8LL * 1024 * 1024;

    /** @param most never more than this */
    explicit AppendSize(int64_t most);

    int64_t bytes() const { return bytes_; }

    /** An append of this size has taken so long. */
    void tookMs(int64_t milliseconds);

private:
    int64_t least_;
    int64_t most_;
    int64_t bytes_;
};

} // namespace pelliko::service
