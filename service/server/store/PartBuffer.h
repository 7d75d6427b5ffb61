#pragma once

#include "store/PartMemory.h"

#include <cstddef>
#include <functional>
#include <span>
#include <string_view>

namespace pelliko::server
{

/// Bytes that come one after the other until they are a part; a few of them take little memory.
/// One thread at a time. Throws std::bad_alloc.
class PartBuffer
{
public:
    /// An empty one. The memory must live longer.
    explicit PartBuffer(PartMemory &memory) : m_memory(memory) {}
    /// A copy of these bytes with room for `more`.
    PartBuffer(PartMemory &memory, std::string_view bytes, std::size_t more = 0);

    /// Must not make it longer than a part.
    void append(std::string_view bytes);
    /// Appends what `put` puts into the room it is given, of up to `most` bytes, and returns how
    /// much that was. Must not make it longer than a part. Throws what `put` throws.
    std::size_t fill(std::size_t most, const std::function<std::size_t(std::span<char>)> &put);
    /// Keeps the first `size` bytes, of which there must be so many.
    void truncate(std::size_t size) { m_size = size; }

    [[nodiscard]] std::size_t size() const { return m_size; }
    [[nodiscard]] bool empty() const { return m_size == 0; }
    /// Until the next change.
    [[nodiscard]] std::string_view view() const { return {m_bytes.get(), m_size}; }

private:
    void makeRoom(std::size_t size);

    PartMemory &m_memory;
    PartMemory::Room m_bytes;
    std::size_t m_room = 0;
    std::size_t m_size = 0;
};

} // namespace pelliko::server
