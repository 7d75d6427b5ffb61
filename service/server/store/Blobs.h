#pragma once

#include <cstddef>
#include <cstdint>
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

    /// The keys of all blobs that there are.
    virtual std::vector<std::string> keys() = 0;

    /// Removes the blob; one that is absent is as good as removed.
    virtual void remove(const std::string &key) = 0;

    /// An address that everybody may get the finished blob from; nothing where there is none, or
    /// where the operator does not want it.
    virtual std::optional<std::string> addressOf(const std::string &, const BlobVisit &)
    {
        return std::nullopt;
    }

    /// How many calls may wait for the store at the same time without one keeping it busy.
    [[nodiscard]] virtual std::size_t callsAtOnce() const { return 8; }
};

} // namespace pelliko::server
