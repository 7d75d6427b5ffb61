#pragma once

#include <cstddef>
#include <memory>
#include <mutex>
#include <vector>

namespace pelliko::server
{

/// Room for the parts that wait in memory. To get a part's memory from the kernel takes about as
/// long as to copy its bytes there, since each page is cleared first: so it is of huge pages where
/// the kernel has them, and some of what comes back waits here for the next part. The kernel may
/// have the pages of what waits whenever it needs them. Thread-safe.
class PartMemory
{
public:
    /// So many parts' rooms wait at most.
    static constexpr std::size_t mostKept = 16;

    PartMemory() { m_kept.reserve(mostKept); }
    ~PartMemory();
    PartMemory(const PartMemory &) = delete;
    PartMemory &operator=(const PartMemory &) = delete;

    /// Gives a room back to where it is from, or to the C library.
    struct GiveBack {
        PartMemory *home = nullptr;
        void operator()(char *room) const;
    };
    using Room = std::unique_ptr<char, GiveBack>;

    /// A room of a part's size, aligned to huge pages, with anything in it, for as long as this
    /// object lives. Throws std::bad_alloc.
    Room take();

    [[nodiscard]] std::size_t kept();

private:
    void giveBack(char *room);

    std::mutex m_mutex;
    /// What was used last comes first: it may still be in the processor's caches. Never grows
    /// beyond what was reserved: to give a room back must not fail.
    std::vector<char *> m_kept;
};

} // namespace pelliko::server
