#include "store/PostgresPeers.h"
#include "PostgresStores.h"
#include "store/PostgresClock.h"
#include "store/PostgresMetadata.h"
#include "text/Secrets.h"

#include <gmock/gmock.h>

#include <chrono>
#include <condition_variable>
#include <future>
#include <mutex>

namespace pelliko::server
{
namespace
{

using namespace std::chrono_literals;
using testing::Contains;
using testing::UnorderedElementsAre;

constexpr auto patience = 30s;

/// One server among others, which remembers what it heard.
class Server
{
public:
    Server()
        : m_peers(std::make_unique<PostgresPeers>(postgresUrl(), std::make_shared<PostgresClock>()))
    {
        Peers::Ears ears;
        ears.pushes = [this](const auto &accounts) {
            for (const std::int64_t account : accounts)
                hear("push " + std::to_string(account));
        };
        ears.missed = [this] { hear("missed"); };
        ears.stopWriting = [this](const std::string &blob) {
            hear("stop " + blob);
            if (m_letsGo)
                m_peers->release(blob);
        };
        ears.stopAllWriting = [this] { hear("stop all"); };
        ears.sweep = [this] { hear("sweep"); };
        m_peers->listen(std::move(ears));
    }

    void hear(const std::string &what)
    {
        const std::lock_guard lock(m_mutex);
        m_heard.push_back(what);
        m_changed.notify_all();
    }

    /// True once it heard that.
    bool waitFor(const std::string &what)
    {
        std::unique_lock lock(m_mutex);
        return m_changed.wait_for(lock, patience, [&] { return has(what); });
    }

    bool heard(const std::string &what)
    {
        const std::lock_guard lock(m_mutex);
        return has(what);
    }

    void forget()
    {
        const std::lock_guard lock(m_mutex);
        m_heard.clear();
    }

    std::future<Peers::Claimed> claim(const std::string &blob)
    {
        auto claimed = std::make_shared<std::promise<Peers::Claimed>>();
        m_peers->claim(blob, [claimed](const Peers::Claimed &what) { claimed->set_value(what); });
        return claimed->get_future();
    }

    /// Its sessions end, as they do when it is killed.
    void die() { m_peers->close(); }

    void doNotLetGo() { m_letsGo = false; }
    Peers &peers() { return *m_peers; }

private:
    bool has(const std::string &what) const
    {
        return std::find(m_heard.begin(), m_heard.end(), what) != m_heard.end();
    }

    std::mutex m_mutex;
    std::condition_variable m_changed;
    std::vector<std::string> m_heard;
    std::atomic<bool> m_letsGo{true};
    std::unique_ptr<PostgresPeers> m_peers;
};

class PostgresServers : public testing::TestWithParam<std::string>
{
protected:
    void SetUp() override
    {
        emptyDatabase();
        m_store = std::make_unique<PostgresMetadata>(postgresUrl(), 1);
        m_store->addAccount("+491", "", token, 900);
        m_account = m_store->findAccount(token)->id;
        m_share = make();
        m_blob = m_share.files[0].blob;
    }

    ShareRecord make(std::uint64_t size = 10)
    {
        NewShare share;
        share.account = m_account;
        share.files = {{"file", "", size}};
        share.recipients = {{"+491", ""}};
        share.now = 1000;
        share.deadline = 5000;
        share.dailyLimit = 1000;
        return m_store->createShare(share).share;
    }

    static Peers::Claimed answer(std::future<Peers::Claimed> &claimed)
    {
        EXPECT_EQ(claimed.wait_for(patience), std::future_status::ready);
        return claimed.get();
    }

    std::int64_t claimNow(Server &server)
    {
        auto claimed = server.claim(m_blob);
        return answer(claimed).right;
    }

    const std::string token = std::string(32, 't');
    std::unique_ptr<PostgresMetadata> m_store;
    std::int64_t m_account = 0;
    ShareRecord m_share;
    std::string m_blob;
};

// Without scripts/with-postgres there is nothing to test with.
GTEST_ALLOW_UNINSTANTIATED_PARAMETERIZED_TEST(PostgresServers);
INSTANTIATE_TEST_SUITE_P(Engine, PostgresServers, testing::ValuesIn(postgresUrls()),
                         [](const auto &) { return "Real"; });

TEST_P(PostgresServers, WhoWritesABlobIsAskedByTheNextOneAndLetsGo)
{
    Server first;
    Server second;
    const std::int64_t before = claimNow(first);
    EXPECT_TRUE(m_store->recordOffset(m_blob, 3, before));
    const std::int64_t after = claimNow(second);
    EXPECT_TRUE(first.heard("stop " + m_blob));
    EXPECT_NE(after, before);
    EXPECT_FALSE(m_store->recordOffset(m_blob, 5, before));
    EXPECT_TRUE(m_store->recordOffset(m_blob, 4, after));
}

TEST_P(PostgresServers, ManyWhoWantABlobGetItOneAfterTheOther)
{
    std::array<Server, 5> servers;
    std::vector<std::future<Peers::Claimed>> claims;
    for (Server &server : servers)
        claims.push_back(server.claim(m_blob));
    const auto start = std::chrono::steady_clock::now();
    std::set<std::int64_t> rights;
    for (auto &claimed : claims)
        rights.insert(answer(claimed).right);
    EXPECT_EQ(rights.size(), servers.size());
    EXPECT_EQ(rights.count(0), 0U);
    EXPECT_LT(std::chrono::steady_clock::now() - start, patience);
}

TEST_P(PostgresServers, AClaimTellsWhatIsNotedOfAWantedBlob)
{
    Server first;
    Server second;
    auto fresh = first.claim(m_blob);
    const Peers::Claimed one = answer(fresh);
    EXPECT_EQ(one.noted, 0U);
    m_store->recordOffset(m_blob, 8, one.right);
    auto later = second.claim(m_blob);
    EXPECT_EQ(answer(later).noted, 8U) << "it was let go by the other";
    m_store->withdrawShare(m_account, m_share.key, 1000);
    auto ended = first.claim(m_blob);
    EXPECT_EQ(answer(ended).noted, std::nullopt);
}

TEST_P(PostgresServers, AClaimTellsWhatWasNotedWhileItWasMade)
{
    Server server;
    PostgresConnection former(postgresUrl());
    former.command("BEGIN");
    former.query("UPDATE blobs SET received = 7 WHERE key = $1", m_blob);
    auto claimed = server.claim(m_blob);
    PostgresConnection watcher(postgresUrl());
    EXPECT_NO_THROW(watcher.command("DO $$ BEGIN WHILE NOT EXISTS (SELECT FROM pg_locks"
                                    " WHERE NOT granted) LOOP PERFORM pg_sleep(0.01);"
                                    " END LOOP; END $$"));
    former.command("COMMIT");
    EXPECT_EQ(answer(claimed).noted, 7U);
}

TEST_P(PostgresServers, ADeadServersBlobsAreFree)
{
    Server first;
    Server second;
    claimNow(first);
    first.die();
    EXPECT_NE(claimNow(second), 0);
    EXPECT_FALSE(second.heard("stop all"));
}

TEST_P(PostgresServers, AStuckServersBlobIsTakenAndItsOffsetsAreRefused)
{
    Server first;
    first.doNotLetGo();
    Server second;
    const std::int64_t stuck = claimNow(first);
    const auto start = std::chrono::steady_clock::now();
    const std::int64_t right = claimNow(second);
    const auto took = std::chrono::steady_clock::now() - start;
    EXPECT_GE(took, 2s) << "it was given time";
    EXPECT_NE(right, 0);
    EXPECT_FALSE(m_store->recordOffset(m_blob, 9, stuck));
    EXPECT_TRUE(m_store->recordOffset(m_blob, 8, right));
    EXPECT_EQ(m_store->findUpload(m_account, m_share.files[0].upload, 1000)->file.offset, 8U);
}

TEST_P(PostgresServers, AClaimThatCannotBeNotedIsRefusedAndLeavesTheBlobFree)
{
    Server first;
    Server second;
    EXPECT_NE(claimNow(first), 0);
    PostgresConnection db(postgresUrl());
    db.command("CREATE FUNCTION refuse() RETURNS trigger LANGUAGE plpgsql AS $$ BEGIN"
               " RAISE disk_full; END $$;"
               "CREATE TRIGGER refused BEFORE UPDATE ON blobs FOR EACH ROW"
               " EXECUTE FUNCTION refuse()");
    auto waited = second.claim(m_blob);
    EXPECT_TRUE(answer(waited).error) << "it was let go by the other";
    auto direct = first.claim(m_blob);
    EXPECT_TRUE(answer(direct).error);
    // Ends with the statement's own time limit where a lock is left behind.
    EXPECT_NO_THROW(db.command("DO $$ BEGIN WHILE EXISTS (SELECT FROM pg_locks WHERE objsubid = 1"
                               " AND locktype = 'advisory') LOOP PERFORM pg_sleep(0.01);"
                               " END LOOP; END $$"));
    db.command("DROP TRIGGER refused ON blobs");
    EXPECT_NE(claimNow(second), 0);
}

TEST_P(PostgresServers, AWithdrawnUploadStopsOnWhicheverServer)
{
    Server server;
    claimNow(server);
    m_store->withdrawShare(m_account, m_share.key, 1000);
    EXPECT_TRUE(server.waitFor("stop " + m_blob));
}

TEST_P(PostgresServers, APushIsHeardByEveryServer)
{
    Server first;
    Server second;
    // Only who listens already hears.
    ASSERT_TRUE(first.waitFor("missed"));
    ASSERT_TRUE(second.waitFor("missed"));
    const ShareRecord share = make(0);
    m_store->finishShare(m_account, share.key, "link", 1000, 5000);
    const std::string push = "push " + std::to_string(m_account);
    EXPECT_TRUE(first.waitFor(push));
    EXPECT_TRUE(second.waitFor(push));
}

TEST_P(PostgresServers, WhoWasCutOffLosesItsRightsAndLooksAgain)
{
    Server server;
    claimNow(server);
    server.forget();
    PostgresConnection(postgresUrl())
        .command("SELECT pg_terminate_backend(pid) FROM pg_stat_activity"
                 " WHERE pid <> pg_backend_pid() AND datname = current_database()");
    EXPECT_TRUE(server.waitFor("stop all"));
    EXPECT_TRUE(server.waitFor("missed"));
    EXPECT_NE(claimNow(server), 0);
}

TEST_P(PostgresServers, OneServerSweepsAndAnotherWhenItIsGone)
{
    Server first;
    ASSERT_TRUE(first.waitFor("sweep"));
    Server second;
    ASSERT_TRUE(second.waitFor("missed"));
    EXPECT_TRUE(first.peers().sweeps());
    EXPECT_FALSE(second.peers().sweeps());
    first.forget();
    second.peers().wakeSweeper();
    EXPECT_TRUE(first.waitFor("sweep")) << "the other's wish";
    EXPECT_FALSE(second.heard("sweep"));
    first.die();
    EXPECT_TRUE(second.waitFor("sweep"));
    EXPECT_TRUE(second.peers().sweeps());
}

TEST_P(PostgresServers, WhatCannotBeReachedRefusesClaims)
{
    PostgresPeers peers("postgresql:///none?host=/nonexistent", std::make_shared<PostgresClock>());
    peers.listen({});
    std::promise<Peers::Claimed> claimed;
    peers.claim(m_blob, [&](const Peers::Claimed &what) { claimed.set_value(what); });
    auto future = claimed.get_future();
    EXPECT_TRUE(answer(future).error);
}

} // namespace
} // namespace pelliko::server
