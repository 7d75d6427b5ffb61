#pragma once

#include "store/StoreMark.h"

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace pelliko::server
{

/// One blob open for writing. One thread at a time; `sync` may run beside `write`.
class BlobWriter
{
public:
    virtual ~BlobWriter() = default;

    /// Writes all of `bytes` at `offset`, which is at most the end of what is stored. What stood
    /// behind them may stay or go.
    virtual void write(std::uint64_t offset, std::string_view bytes) = 0;

    /// Puts bytes at the beginning of a room and returns how many.
    using Filler = std::function<std::size_t(std::span<char> room)>;

    /// A write of what `fill` puts into the store's own memory, which spares a copy: returns how
    /// much that was; nothing, and `fill` is not called, where bytes have to be given to `write`.
    /// Does not wait for the store. Throws std::bad_alloc, and what `fill` throws.
    virtual std::optional<std::size_t> fill(std::uint64_t /*offset*/, const Filler & /*fill*/)
    {
        return std::nullopt;
    }

    /// Drops the bytes from `size` on and gives their space back.
    virtual void truncate(std::uint64_t size) = 0;

    /// Returns once everything written before is on stable storage, the blob's name included.
    virtual void sync() = 0;

    /// Makes durable what is worth it while more is coming, and returns the end of what is durable;
    /// `end` is that of what was written so far. May run beside `write`.
    virtual std::uint64_t settle(std::uint64_t end)
    {
        sync();
        return end;
    }

    /// A sync of a blob that is whole now: nothing more is written. May be called again.
    virtual void finish() { sync(); }
};

/// One blob open for reading; stays readable while it is removed elsewhere.
class BlobReader
{
public:
    virtual ~BlobReader() = default;

    /// Reads up to `into.size()` bytes at `offset`; 0 only at the end.
    virtual std::size_t read(std::uint64_t offset, std::span<char> into) = 0;

    /// A descriptor that the kernel can send from, or -1 where there is none. Owned by the reader.
    [[nodiscard]] virtual int descriptor() const { return -1; }
};

/// How somebody is to get a blob who does not ask this server for its bytes.
struct BlobVisit {
    /// After which the address leads nowhere.
    std::int64_t seconds = 0;
    /// The answer's Content-Disposition and Content-Type.
    std::string disposition;
    std::string type;
};

/// A blob as a list of what there is shows it.
struct StoredBlob {
    std::string key;
    /// How many bytes an upload can go on from, or a reader get; nothing when only `sizeOf` tells.
    std::optional<std::uint64_t> size;
    /// Something of its making stands beside the whole blob.
    bool hasLeftovers = false;
};

/// Where the bytes of files are. Keys are tokens (see looksLikeToken). Thread-safe; calls may
/// block; every call throws StorageFailure when the store fails.
class Blobs
{
public:
    virtual ~Blobs() = default;

    /// Opens the blob for writing and makes it when it is absent; bytes it holds stay.
    virtual std::unique_ptr<BlobWriter> openForWriting(const std::string &key) = 0;

    /// Null when there is no such blob. One that is still being written may have an end put to it,
    /// so only its writer's process looks into it before it is whole.
    virtual std::unique_ptr<BlobReader> openForReading(const std::string &key) = 0;

    /// What there is, `most` blobs or a little more at a time, in the order of the keys' bytes:
    /// those that follow `after`. Nothing at the end. Blobs that come or go meanwhile may be
    /// missed.
    virtual std::vector<StoredBlob> list(const std::string &after, std::size_t most) = 0;

    /// How many bytes of the blob an upload can go on from, or a reader get; nothing when it is
    /// absent. Changes nothing of it.
    virtual std::optional<std::uint64_t> sizeOf(const std::string &key) = 0;

    /// Removes the blob; one that is absent is as good as removed.
    virtual void remove(const std::string &key) = 0;

    /// Removes what is left of the making of a blob that is whole, to which nothing is written.
    virtual void removeLeftovers(const std::string & /*key*/) {}

    /// Where this store stands in a move of data; nothing in none. It has room for one such mark
    /// beside the blobs.
    virtual std::optional<StoreMark> mark() = 0;
    virtual void setMark(const std::optional<StoreMark> &mark) = 0;

    /// An address that everybody may get the finished blob from; nothing where there is none, or
    /// where the operator does not want it.
    virtual std::optional<std::string> addressOf(const std::string &, const BlobVisit &)
    {
        return std::nullopt;
    }

    /// False when the store could not be reached the last time. Does not wait.
    [[nodiscard]] virtual bool wasReached() const { return true; }

    /// Asks the store for a sign of life.
    virtual void ping() {}

    /// How many calls may wait for the store at the same time without one keeping it busy.
    [[nodiscard]] virtual std::size_t callsAtOnce() const { return 8; }
};

} // namespace pelliko::server
