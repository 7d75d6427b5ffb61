#include "PostgresStores.h"
#include "MetadataSuite.h"
#include "store/PostgresMetadata.h"
#include "store/StorageFailure.h"
#include "text/Secrets.h"

#include <gmock/gmock.h>

#include <atomic>
#include <latch>
#include <thread>

namespace pelliko::server
{
namespace
{

using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;

std::unique_ptr<PostgresMetadata> open(std::size_t connections = 2)
{
    return std::make_unique<PostgresMetadata>(postgresUrl(), connections);
}

std::vector<MetadataMaker> makers()
{
    if (postgresUrl().empty())
        return {};
    return {{"Postgres",
             [] {
                 emptyDatabase();
                 return open();
             },
             [] { return open(); }}};
}

INSTANTIATE_TEST_SUITE_P(MetadataPostgres, MetadataSuite, testing::ValuesIn(makers()),
                         [](const auto &info) { return info.param.name; });

/// Many servers at once on one database: each thread is one, with a store of its own.
class Postgres : public testing::TestWithParam<std::string>
{
protected:
    static constexpr int servers = 20;

    void SetUp() override
    {
        emptyDatabase();
        m_store = open();
        m_anna = join("+491", 'a');
    }

    std::int64_t join(const std::string &number, char token)
    {
        EXPECT_TRUE(m_store->addAccount(number, "", std::string(32, token), 900));
        return m_store->findAccount(std::string(32, token))->id;
    }

    static NewShare shareOf(std::int64_t account, std::uint64_t size, const std::string &recipient)
    {
        NewShare share;
        share.account = account;
        share.files = {{"file", "text/plain", size}};
        share.recipients = {{recipient, ""}};
        share.now = 1000;
        share.deadline = 5000;
        share.dailyLimit = 1000;
        return share;
    }

    ShareRecord finished(std::int64_t account, const std::string &recipient)
    {
        const ShareRecord share = m_store->createShare(shareOf(account, 0, recipient)).share;
        return m_store->finishShare(account, share.key, randomToken(), 1000, 5000).share;
    }

    /// Runs `work` on each server's store, all at once.
    template <class Work> static void atOnce(int count, Work work)
    {
        std::latch start(count);
        std::vector<std::thread> threads;
        for (int number = 0; number < count; ++number)
            threads.emplace_back([&, number] {
                const auto store = open(1);
                start.arrive_and_wait();
                work(*store, number);
            });
        for (std::thread &thread : threads)
            thread.join();
    }

    /// Ends every other session, as a restart of the database does.
    static void endSessions()
    {
        PostgresConnection db(postgresUrl());
        db.command("SELECT pg_terminate_backend(pid, 10000) FROM pg_stat_activity"
                   " WHERE pid <> pg_backend_pid() AND datname = current_database()");
    }

    static std::int64_t count(const char *sql)
    {
        PostgresConnection db(postgresUrl());
        PostgresRows row = db.command(sql);
        return row.next() ? row.integer(0) : -1;
    }

    std::unique_ptr<PostgresMetadata> m_store;
    std::int64_t m_anna = 0;
};

// Without scripts/with-postgres there is nothing to test with.
GTEST_ALLOW_UNINSTANTIATED_PARAMETERIZED_TEST(Postgres);
INSTANTIATE_TEST_SUITE_P(Engine, Postgres, testing::ValuesIn(postgresUrls()),
                         [](const auto &) { return "Real"; });

TEST_P(Postgres, ServersThatStartAtOnceMakeTheTablesOnce)
{
    m_store.reset();
    emptyDatabase();
    atOnce(servers, [](Metadata &store, int number) {
        EXPECT_TRUE(store.addAccount("+49" + std::to_string(number), "", randomToken(), 900));
    });
    EXPECT_THAT(open()->listAccounts(), SizeIs(servers));
    EXPECT_EQ(count("SELECT count(*) FROM layout"), 1);
}

TEST_P(Postgres, ADatabaseOfANewerServerIsLeftAlone)
{
    PostgresConnection(postgresUrl()).command("UPDATE layout SET version = 99");
    EXPECT_THROW(open(), StorageFailure);
    EXPECT_EQ(count("SELECT version FROM layout"), 99);
}

TEST_P(Postgres, TheDailyLimitHoldsWhenTwentyServersCount)
{
    std::atomic<int> made = 0;
    atOnce(servers, [&](Metadata &store, int) {
        for (int share = 0; share < 3; ++share)
            made += store.createShare(shareOf(m_anna, 50, "+492")).outcome ==
                            CreateResult::Outcome::created
                        ? 1
                        : 0;
    });
    EXPECT_EQ(made, 20);
    EXPECT_EQ(m_store->usedBytes(m_anna, 0), 1000U);
}

TEST_P(Postgres, QuestionsAboutNumbersAreCountedByTwentyServers)
{
    std::atomic<int> allowed = 0;
    atOnce(servers, [&](Metadata &store, int) {
        allowed += store.askJoined({m_anna, {"+491", "+492"}, 1000, 24, 100}).allowed ? 1 : 0;
    });
    EXPECT_EQ(allowed, 12);
}

TEST_P(Postgres, AKeyThatTwentyServersGetMakesOneShare)
{
    atOnce(servers, [&](Metadata &store, int) {
        NewShare share = shareOf(m_anna, 100, "+492");
        share.idempotencyKey = "once";
        store.createShare(share);
    });
    EXPECT_THAT(m_store->listShares(m_anna, 1000), SizeIs(1));
    EXPECT_EQ(m_store->usedBytes(m_anna, 0), 100U);
}

TEST_P(Postgres, ACodeForFiveMakesFiveAccountsOnTwentyServers)
{
    m_store->addInvitation({"code", "", 5, 900, 2000});
    std::atomic<int> registered = 0;
    atOnce(servers, [&](Metadata &store, int number) {
        const std::string text = std::to_string(number);
        registered += store.registerAccount({"code", "+4930" + text, randomToken(), text, 1000}) ==
                              RegisterResult::registered
                          ? 1
                          : 0;
    });
    EXPECT_EQ(registered, 5);
    EXPECT_THAT(m_store->listAccounts(), SizeIs(6));
}

TEST_P(Postgres, AFinishThatTwentyServersGetMakesOnePush)
{
    join("+492", 'b');
    const ShareRecord share = m_store->createShare(shareOf(m_anna, 0, "+492")).share;
    std::atomic<int> pushed = 0;
    atOnce(servers, [&](Metadata &store, int) {
        const auto result = store.finishShare(m_anna, share.key, randomToken(), 1000, 5000);
        pushed += static_cast<int>(result.pushed.size());
    });
    EXPECT_EQ(pushed, 1);
    EXPECT_THAT(*m_store->waitingPushes(std::string(32, 'b'), 0, 1000), SizeIs(1));
}

TEST_P(Postgres, PeopleWhoShareWithEachOtherDoNotStopEachOther)
{
    const std::int64_t berta = join("+492", 'b');
    atOnce(8, [&](Metadata &store, int number) {
        const bool isAnna = number % 2 == 0;
        const std::int64_t account = isAnna ? m_anna : berta;
        for (int round = 0; round < 10; ++round) {
            NewShare share = shareOf(account, 0, "+491");
            share.recipients.push_back({"+492", ""});
            const std::string key = store.createShare(share).share.key;
            EXPECT_THAT(store.finishShare(account, key, randomToken(), 1000, 5000).pushed,
                        SizeIs(2));
        }
    });
    EXPECT_EQ(count("SELECT last_push FROM accounts WHERE number = '+491'"), 80);
    EXPECT_EQ(count("SELECT last_push FROM accounts WHERE number = '+492'"), 80);
}

TEST_P(Postgres, OfTwoSharesOfOneBlobThatEndAtOnceTheLastOneDoomsIt)
{
    for (int round = 0; round < 20; ++round) {
        const ShareRecord first = finished(m_anna, "+492");
        NewShare copy = shareOf(m_anna, 0, "+492");
        copy.reshareOf = first.key;
        const ShareRecord second = m_store->createShare(copy).share;
        atOnce(2, [&](Metadata &store, int number) {
            store.withdrawShare(m_anna, number == 0 ? first.key : second.key, 1000);
        });
        ASSERT_THAT(m_store->doomedBlobs(), ElementsAre(first.files[0].blob)) << round;
        m_store->forgetBlob(first.files[0].blob);
    }
}

TEST_P(Postgres, ARestartOfTheDatabaseIsNotNoticed)
{
    const ShareRecord share = m_store->createShare(shareOf(m_anna, 10, "+492")).share;
    endSessions();
    EXPECT_TRUE(m_store->recordOffset(share.files[0].blob, 10));
    endSessions();
    EXPECT_EQ(m_store->finishShare(m_anna, share.key, "link", 1000, 5000).outcome,
              FinishResult::Outcome::finished);
    endSessions();
    EXPECT_TRUE(m_store->findLink("link", 1000));
}

/// A trigger at the commit stands for everything that may happen to a session there.
TEST_P(Postgres, ASessionThatEndsAtTheCommitLeavesNothingHalfDone)
{
    PostgresConnection(postgresUrl())
        .command("CREATE SEQUENCE commits; CREATE FUNCTION die() RETURNS trigger LANGUAGE plpgsql"
                 " AS $$ BEGIN IF nextval('commits') < 3 THEN"
                 " PERFORM pg_terminate_backend(pg_backend_pid()); PERFORM pg_sleep(1);"
                 " END IF; RETURN NULL; END $$;"
                 "CREATE CONSTRAINT TRIGGER dying AFTER INSERT ON shares"
                 " DEFERRABLE INITIALLY DEFERRED FOR EACH ROW EXECUTE FUNCTION die()");
    EXPECT_EQ(m_store->createShare(shareOf(m_anna, 10, "+492")).outcome,
              CreateResult::Outcome::created);
    EXPECT_THAT(m_store->listShares(m_anna, 1000), SizeIs(1));
    EXPECT_EQ(m_store->usedBytes(m_anna, 0), 10U);
}

TEST_P(Postgres, ARightThatWasGivenToAnotherNotesNothing)
{
    const std::string blob = m_store->createShare(shareOf(m_anna, 10, "+492")).share.files[0].blob;
    PostgresConnection(postgresUrl()).command("UPDATE blobs SET writer = 7");
    EXPECT_FALSE(m_store->recordOffset(blob, 5, 6));
    EXPECT_TRUE(m_store->recordOffset(blob, 4, 7));
    EXPECT_EQ(count("SELECT received FROM blobs"), 4);
}

TEST_P(Postgres, NobodyReachableIsToldAsSuchAndSoon)
{
    StorageFailure::Kind kind = StorageFailure::Kind::broken;
    try {
        PostgresMetadata("postgresql:///none?host=/nonexistent&user=nobody", 1);
    } catch (const StorageFailure &failure) {
        kind = failure.kind();
    }
    EXPECT_EQ(kind, StorageFailure::Kind::unavailable);
}

TEST_P(Postgres, WhatIsNoTextIsNobodysKey)
{
    EXPECT_FALSE(m_store->findUpload(m_anna, std::string("\xff\0x", 3), 1000));
    EXPECT_FALSE(m_store->findShare(m_anna, std::string("\xff\0x", 3), 1000));
    EXPECT_FALSE(m_store->withdrawShare(m_anna, std::string("\xff\0x", 3), 1000));
}

} // namespace
} // namespace pelliko::server
