#pragma once

#include "store/Peers.h"

#include <memory>
#include <string>

namespace pelliko::server
{

class PostgresClock;

/// Servers that have one database in common. A thread of its own keeps two sessions: one holds a
/// lock for each blob that this server writes and hears what others tell, one waits for the lock of
/// the server that sweeps. Locks end with their session, and a session with its server. Who was
/// slow, and does not know yet that another has its blob, is refused when it notes an offset.
class PostgresPeers final : public Peers
{
public:
    PostgresPeers(const std::string &url, std::shared_ptr<PostgresClock> clock);
    ~PostgresPeers() override;

    void listen(Ears ears) override;
    void close() override;
    void claim(const std::string &blob, ClaimDone done) override;
    void release(const std::string &blob) noexcept override;
    [[nodiscard]] bool sweeps() const override;
    void wakeSweeper() override;
    [[nodiscard]] bool tellsOfTokens() const override { return true; }
    /// Nothing is left to do: the transaction that made the pushes has told all servers.
    void announcePushes(const std::vector<std::int64_t> & /*accounts*/) override {}

private:
    class Thread;
    std::unique_ptr<Thread> m_thread;
};

} // namespace pelliko::server
