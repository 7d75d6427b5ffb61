#include "store/PartBuffer.h"

#include "store/S3Layout.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <new>
#include <utility>

namespace pelliko::server
{
namespace
{

/// Most files are small: they take no more than this, and a longer one has a part's room at once,
/// of which the kernel gives only the pages that are written to.
constexpr std::size_t small = 256UL * 1024;

PartMemory::Room smallRoom()
{
    PartMemory::Room room(static_cast<char *>(std::malloc(small)));
    if (!room)
        throw std::bad_alloc();
    return room;
}

} // namespace

PartBuffer::PartBuffer(PartMemory &memory, std::string_view bytes, std::size_t more)
    : m_memory(memory)
{
    makeRoom(bytes.size() + more);
    append(bytes);
}

void PartBuffer::makeRoom(std::size_t size)
{
    if (size <= m_room)
        return;
    PartMemory::Room room = size <= small ? smallRoom() : m_memory.take();
    if (m_size > 0)
        std::memcpy(room.get(), m_bytes.get(), m_size);
    m_bytes = std::move(room);
    m_room = size <= small ? small : s3PartSize;
}

void PartBuffer::append(std::string_view bytes)
{
    if (bytes.empty())
        return;
    makeRoom(m_size + bytes.size());
    std::memcpy(m_bytes.get() + m_size, bytes.data(), bytes.size());
    m_size += bytes.size();
}

std::size_t PartBuffer::fill(std::size_t most,
                             const std::function<std::size_t(std::span<char>)> &put)
{
    if (m_size == m_room)
        makeRoom(m_size + 1);
    const std::size_t count = put({m_bytes.get() + m_size, std::min(most, m_room - m_size)});
    m_size += count;
    return count;
}

} // namespace pelliko::server
