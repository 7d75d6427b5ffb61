#pragma once

#include "http/Exchange.h"
#include "store/Blobs.h"
#include "store/Peers.h"

#include <boost/asio/steady_timer.hpp>

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <unordered_map>

namespace pelliko::server
{

/// A blob that is being written, or removed: it has one such record at a time.
struct ActiveWrite {
    std::string key;
    /// Null as long as no byte is to be written.
    std::shared_ptr<BlobWriter> writer;
    /// The end of what was handed to the writer; durable only after its sync.
    std::uint64_t written = 0;
    /// The end of what may have been noted as durable; nothing before it is dropped.
    std::uint64_t kept = 0;
    /// The end of the whole file.
    std::uint64_t size = 0;
    /// What Peers gave for it, to be shown with every offset.
    std::int64_t right = 0;
    /// What of the blob is noted, when Peers have told it with the right.
    std::optional<std::uint64_t> noted{};
};

/// Who writes which blob right now: of this server's requests one, and of all servers one. Network
/// thread only.
class ActiveWrites
{
public:
    explicit ActiveWrites(Peers &peers) : m_peers(peers) {}

    /// The right to write one blob, until destroyed.
    class Lease
    {
    public:
        Lease(Lease &&) noexcept = default;
        Lease(const Lease &) = delete;
        Lease &operator=(const Lease &) = delete;
        Lease &operator=(Lease &&) = delete;
        ~Lease();

        [[nodiscard]] const std::shared_ptr<ActiveWrite> &write() const;

    private:
        friend class ActiveWrites;
        struct Entry;
        explicit Lease(std::shared_ptr<Entry> entry) : m_entry(std::move(entry)) {}
        std::shared_ptr<Entry> m_entry;
    };

    /// Ends whoever has the blob now, waits until that one let go, and takes its place. `stop` is
    /// called when the next one wants it. Throws StorageFailure when the servers' common store does
    /// not give the right.
    Task<Lease> take(std::string key, std::function<void()> stop);

    /// What is being written under this key, or null.
    [[nodiscard]] std::shared_ptr<ActiveWrite> find(const std::string &key) const;

    [[nodiscard]] std::size_t count() const { return m_entries.size(); }

    /// Asks the blob's writer, if there is one, to end.
    void stop(const std::string &key);
    void stopAll();

private:
    [[nodiscard]] Task<Peers::Claimed> claim(std::string key);

    Peers &m_peers;
    std::unordered_map<std::string, std::shared_ptr<Lease::Entry>> m_entries;
};

} // namespace pelliko::server
