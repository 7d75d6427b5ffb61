#include "MetadataSuite.h"
#include "text/Secrets.h"

#include <gmock/gmock.h>

namespace pelliko::server
{
namespace
{

using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;

const std::string bertasToken(32, '\x21');
const std::string carlsToken(32, '\x22');

/// Those of a share's recipients in the suite's shares.
constexpr const char *berta = "+492";
constexpr const char *carl = "+493";

std::vector<std::int64_t> idsOf(const std::vector<Push> &pushes)
{
    std::vector<std::int64_t> ids;
    for (const Push &push : pushes)
        ids.push_back(push.id);
    return ids;
}

std::int64_t join(Metadata &store, const char *number, const std::string &tokenHash)
{
    EXPECT_TRUE(store.addAccount(number, "", tokenHash, 900));
    return store.findAccount(tokenHash)->id;
}

std::vector<std::int64_t> waiting(Metadata &store, const std::string &token, std::int64_t after = 0,
                                  Seconds now = 1000)
{
    const auto pushes = store.waitingPushes(token, after, now);
    EXPECT_TRUE(pushes);
    return pushes ? idsOf(*pushes) : std::vector<std::int64_t>{};
}

} // namespace

TEST_P(MetadataSuite, RecipientsWithAnAccountGetAPushAndTheOthersAnSms)
{
    const std::int64_t account = join(*m_store, berta, bertasToken);
    const ShareRecord share = make({0});
    const FinishResult first = m_store->finishShare(m_account, share.key, "link", 1000, 1200);
    EXPECT_THAT(first.pushed, ElementsAre(account));
    EXPECT_THAT(first.sms, ElementsAre(carl));
    const FinishResult again = m_store->finishShare(m_account, share.key, "other", 1000, 1200);
    EXPECT_THAT(again.pushed, IsEmpty());
    EXPECT_THAT(again.sms, ElementsAre(carl));
    EXPECT_THAT(waiting(*m_store, bertasToken), ElementsAre(1));
}

TEST_P(MetadataSuite, PushesWaitUntilTheyAreAcknowledged)
{
    const std::int64_t account = join(*m_store, berta, bertasToken);
    for (const char *link : {"a", "b", "c"})
        makeFinished(1, link);
    EXPECT_THAT(waiting(*m_store, bertasToken, 1), ElementsAre(2, 3));
    EXPECT_THAT(waiting(*m_store, bertasToken, 4), ElementsAre(1, 2, 3)) << "never given out";
    EXPECT_FALSE(m_store->acknowledgePushes(account, 4));
    EXPECT_TRUE(m_store->acknowledgePushes(account, 2));
    m_store.reset();
    m_store = GetParam().again();
    EXPECT_THAT(waiting(*m_store, bertasToken), ElementsAre(3));
    EXPECT_FALSE(m_store->waitingPushes("no token", 0, 1000));
}

TEST_P(MetadataSuite, AnIdIsNeverUsedTwice)
{
    const std::int64_t account = join(*m_store, berta, bertasToken);
    const ShareRecord share = makeFinished(1, "a");
    m_store->withdrawShare(m_account, share.key, 1000);
    m_store->forgetEnded(1000, 0);
    makeFinished(1, "b");
    EXPECT_THAT(waiting(*m_store, bertasToken), ElementsAre(2));
    EXPECT_FALSE(m_store->findReceived(account, {1, {}}, 1000));
}

TEST_P(MetadataSuite, AReceivedShareIsFoundByItsTokenAndByItsAccountOnly)
{
    const std::int64_t account = join(*m_store, berta, bertasToken);
    const std::int64_t other = join(*m_store, carl, carlsToken);
    const ShareRecord share = makeFinished(5, "a");
    const std::string token = m_store->waitingPushes(bertasToken, 0, 1000)->at(0).contentToken;
    EXPECT_THAT(token, SizeIs(22));
    const ReceivedKey key{0, sha256(token)};
    m_store->acknowledgePushes(account, 1);
    const auto received = m_store->findReceived(account, key, 1000);
    ASSERT_TRUE(received);
    EXPECT_EQ(received->senderNumber, "+491");
    EXPECT_EQ(received->share.key, share.key);
    EXPECT_EQ(received->push, 1);
    EXPECT_TRUE(m_store->findReceived(account, {1, {}}, 1000));
    EXPECT_FALSE(m_store->findReceived(other, key, 1000));
    EXPECT_FALSE(m_store->findReceived(m_account, key, 1000));
    EXPECT_FALSE(m_store->findReceived(account, {}, 1000));
}

TEST_P(MetadataSuite, APushOfAShareThatEndedIsDroppedAndTellsWhy)
{
    const std::int64_t account = join(*m_store, berta, bertasToken);
    const ShareRecord withdrawn = makeFinished(1, "a");
    makeFinished(1, "b");
    m_store->withdrawShare(m_account, withdrawn.key, 1000);
    EXPECT_THAT(waiting(*m_store, bertasToken, 0, 1199), ElementsAre(2));
    EXPECT_THAT(waiting(*m_store, bertasToken, 0, 1200), IsEmpty()) << "not yet swept";
    EXPECT_THAT(m_store->listReceived(account, 1200), IsEmpty());
    m_store->expireShares(1200);
    EXPECT_THAT(waiting(*m_store, bertasToken, 0, 1200), IsEmpty());
    EXPECT_EQ(m_store->findReceived(account, {1, {}}, 1200)->share.state, ShareState::withdrawn);
    EXPECT_EQ(m_store->findReceived(account, {2, {}}, 1200)->share.state, ShareState::expired);
    EXPECT_THAT(m_store->listReceived(account, 1200), IsEmpty());
}

TEST_P(MetadataSuite, AcknowledgedSharesStayInTheListUntilTheyAreForgotten)
{
    const std::int64_t account = join(*m_store, berta, bertasToken);
    makeFinished(1, "a");
    makeFinished(1, "b");
    m_store->acknowledgePushes(account, 2);
    m_store->expireShares(1200);
    const auto list = m_store->listReceived(account, 1200);
    ASSERT_THAT(list, SizeIs(2));
    EXPECT_EQ(list[0].push, 2) << "newest first";
    EXPECT_EQ(list[0].share.state, ShareState::expired);
    EXPECT_TRUE(m_store->forgetReceived(account, {1, {}}));
    EXPECT_TRUE(m_store->forgetReceived(account, {1, {}})) << "again";
    EXPECT_FALSE(m_store->forgetReceived(account, {3, {}}));
    EXPECT_FALSE(m_store->forgetReceived(m_account, {2, {}}));
    EXPECT_THAT(m_store->listReceived(account, 1200), SizeIs(1));
}

TEST_P(MetadataSuite, PushesGoWithEitherAccount)
{
    join(*m_store, berta, bertasToken);
    const std::int64_t account = join(*m_store, carl, carlsToken);
    makeFinished(1, "a");
    EXPECT_TRUE(m_store->removeAccount(berta));
    EXPECT_FALSE(m_store->waitingPushes(bertasToken, 0, 1000));
    EXPECT_THAT(m_store->listReceived(account, 1000), SizeIs(1));
    EXPECT_TRUE(m_store->removeAccount("+491"));
    EXPECT_THAT(m_store->listReceived(account, 1000), IsEmpty());
    EXPECT_THAT(waiting(*m_store, carlsToken), IsEmpty());
}

} // namespace pelliko::server
