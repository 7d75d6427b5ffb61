#pragma once

#include <cstdint>
#include <exception>
#include <functional>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace pelliko::server
{

/// What the servers of one store agree on: who writes which blob, who sweeps, who has to be told of
/// what. Rights end with the server that has them, however it ends. Calls return at once.
class Peers
{
public:
    /// What this server hears. Called on a thread of Peers, or by the call that causes it.
    struct Ears {
        /// These accounts have new pushes, or another token than before.
        std::function<void(const std::vector<std::int64_t> &)> pushes;
        /// Messages may have been lost: whoever waits for some has to look.
        std::function<void()> missed;
        /// The blob is not to be written any more, or another server wants to.
        std::function<void(const std::string &blob)> stopWriting;
        /// Rights to write were lost.
        std::function<void()> stopAllWriting;
        /// Something is to be swept, or this server has become the one that sweeps.
        std::function<void()> sweep;
    };

    /// What became of a claim: a number to be shown when offsets are noted, which is no other
    /// server's, or why there is none.
    struct Claimed {
        std::int64_t right = 0;
        std::exception_ptr error;
        /// How many bytes of the blob are noted, which only its new writer changes from here on.
        /// Nothing for a blob that is not wanted, and where Peers do not know.
        std::optional<std::uint64_t> noted{};
    };
    using ClaimDone = std::function<void(const Claimed &)>;

    virtual ~Peers() = default;

    /// Begins; the ears are called until `close` has returned.
    virtual void listen(Ears ears) = 0;
    virtual void close() = 0;

    /// Asks for the right to write the blob, of which a server has one at a time. A server that has
    /// it is asked to let go, and loses it when it does not. `done` is called once, like the ears.
    virtual void claim(const std::string &blob, ClaimDone done) = 0;
    /// Lets go of a right.
    virtual void release(const std::string &blob) noexcept = 0;

    /// Whether this server is the one that sweeps.
    [[nodiscard]] virtual bool sweeps() const = 0;
    /// Wakes the sweeper of the server that sweeps.
    virtual void wakeSweeper() = 0;
    /// Whether every end of a token is heard, also one that another program brings about.
    [[nodiscard]] virtual bool tellsOfTokens() const = 0;
    /// Wakes the streams of these accounts, on whichever server.
    virtual void announcePushes(const std::vector<std::int64_t> &accounts) = 0;
};

/// A server that has its store for itself.
class NoPeers final : public Peers
{
public:
    void listen(Ears ears) override { m_ears = std::move(ears); }
    void close() override { m_ears = {}; }
    void claim(const std::string & /*blob*/, ClaimDone done) override { done({}); }
    void release(const std::string & /*blob*/) noexcept override {}
    [[nodiscard]] bool sweeps() const override { return true; }
    void wakeSweeper() override
    {
        if (m_ears.sweep)
            m_ears.sweep();
    }
    [[nodiscard]] bool tellsOfTokens() const override { return false; }
    void announcePushes(const std::vector<std::int64_t> &accounts) override
    {
        if (m_ears.pushes)
            m_ears.pushes(accounts);
    }

private:
    Ears m_ears;
};

} // namespace pelliko::server
