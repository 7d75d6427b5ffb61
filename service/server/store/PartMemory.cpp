#include "store/PartMemory.h"

#include "store/S3Layout.h"

#include <sys/mman.h>

#include <cstdlib>
#include <new>

namespace pelliko::server
{
namespace
{

/// The kernel's on most machines; elsewhere the advice does what it can.
constexpr std::size_t hugePage = 2UL * 1024 * 1024;
static_assert(s3PartSize % hugePage == 0);

} // namespace

PartMemory::~PartMemory()
{
    for (char *room : m_kept)
        std::free(room);
}

void PartMemory::GiveBack::operator()(char *room) const
{
    if (home != nullptr)
        home->giveBack(room);
    else
        std::free(room);
}

PartMemory::Room PartMemory::take()
{
    {
        const std::lock_guard lock(m_mutex);
        if (!m_kept.empty()) {
            Room room(m_kept.back(), GiveBack{this});
            m_kept.pop_back();
            return room;
        }
    }
    void *memory = std::aligned_alloc(hugePage, s3PartSize);
    if (memory == nullptr)
        throw std::bad_alloc();
    // Advice only: a kernel without huge pages gives small ones.
    ::madvise(memory, s3PartSize, MADV_HUGEPAGE);
    return {static_cast<char *>(memory), GiveBack{this}};
}

void PartMemory::giveBack(char *room)
{
    // Before anybody can take it: what is written after this stays.
    ::madvise(room, s3PartSize, MADV_FREE);
    {
        const std::lock_guard lock(m_mutex);
        if (m_kept.size() < mostKept) {
            m_kept.push_back(room);
            return;
        }
    }
    std::free(room);
}

std::size_t PartMemory::kept()
{
    const std::lock_guard lock(m_mutex);
    return m_kept.size();
}

} // namespace pelliko::server
