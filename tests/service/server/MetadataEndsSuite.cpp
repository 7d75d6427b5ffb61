// How shares, their bytes and what is remembered of them end
#include "MetadataSuite.h"

#include <gmock/gmock.h>

namespace pelliko::server
{

using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;
using Created = CreateResult::Outcome;
using Finished = FinishResult::Outcome;

TEST_P(MetadataSuite, AShareExpiresToTheSecond)
{
    const ShareRecord share = makeFinished(10, linkHash);
    EXPECT_EQ(m_store->findLink(linkHash, 1199)->share.state, ShareState::finished);
    EXPECT_EQ(m_store->findLink(linkHash, 1200)->share.state, ShareState::expired)
        << "also before anybody swept";
    EXPECT_EQ(m_store->finishShare(m_account, share.key, otherLinkHash, 1200, 1400).outcome,
              Finished::gone);
    EXPECT_EQ(m_store->nextDeadline(), 1200);
    EXPECT_THAT(m_store->expireShares(1199), IsEmpty());
    EXPECT_THAT(m_store->expireShares(1200), ElementsAre(share.files[0].blob));
    EXPECT_EQ(m_store->nextDeadline(), std::nullopt);
    EXPECT_EQ(m_store->findLink(linkHash, 1200)->share.state, ShareState::expired);
    EXPECT_THAT(m_store->doomedBlobs(), ElementsAre(share.files[0].blob));
}

TEST_P(MetadataSuite, AnUnfinishedShareIsGivenUp)
{
    const ShareRecord share = make({10});
    ASSERT_TRUE(m_store->recordOffset(share.files[0].blob, 4));
    EXPECT_EQ(m_store->nextDeadline(), 1700);
    EXPECT_THAT(m_store->expireShares(1700), ElementsAre(share.files[0].blob));
    EXPECT_EQ(m_store->findUpload(m_account, share.files[0].upload, 1700)->state,
              ShareState::expired);
    EXPECT_EQ(m_store->usedBytes(m_account, 0), 4U) << "what never came does not count";
}

TEST_P(MetadataSuite, AWithdrawnShareStaysWithdrawn)
{
    const ShareRecord share = makeFinished(10, linkHash);
    EXPECT_THAT(*m_store->withdrawShare(m_account, share.key, 1000),
                ElementsAre(share.files[0].blob));
    EXPECT_THAT(*m_store->withdrawShare(m_account, share.key, 1000), IsEmpty());
    EXPECT_EQ(m_store->findLink(linkHash, 5000)->share.state, ShareState::withdrawn);
    EXPECT_EQ(m_store->usedBytes(m_account, 0), 10U);
    m_store->forgetBlob(share.files[0].blob);
    EXPECT_THAT(m_store->doomedBlobs(), IsEmpty());
}

TEST_P(MetadataSuite, ABlobLivesAsLongAsTheLastShareThatNeedsIt)
{
    const ShareRecord share = makeFinished(10, linkHash);
    NewShare again = shareOf({}, 1000);
    again.reshareOf = share.key;
    const CreateResult reshare = m_store->createShare(again);
    ASSERT_EQ(reshare.outcome, Created::created);
    EXPECT_TRUE(reshare.share.files.at(0).complete());
    EXPECT_EQ(m_store->usedBytes(m_account, 0), 10U) << "a reshare counts towards no limit";
    EXPECT_EQ(m_store->finishShare(m_account, reshare.share.key, otherLinkHash, 1100, 1300).outcome,
              Finished::finished);
    m_store->expireShares(1200);
    EXPECT_THAT(m_store->doomedBlobs(), IsEmpty());
    EXPECT_EQ(m_store->findLink(otherLinkHash, 1299)->share.state, ShareState::finished);
    m_store->expireShares(1300);
    EXPECT_THAT(m_store->doomedBlobs(), ElementsAre(share.files[0].blob));
}

TEST_P(MetadataSuite, OnlyALiveFinishedShareIsSharedAgain)
{
    NewShare again = shareOf({}, 1000);
    again.reshareOf = "unknown";
    EXPECT_EQ(m_store->createShare(again).outcome, Created::sourceMissing);
    again.reshareOf = make({10}).key;
    EXPECT_EQ(m_store->createShare(again).outcome, Created::sourceUnfinished);
    again.reshareOf = makeFinished(10, linkHash).key;
    again.now = 1200;
    EXPECT_EQ(m_store->createShare(again).outcome, Created::sourceGone);
}

TEST_P(MetadataSuite, DroppingAResharedFileLeavesTheOriginal)
{
    const ShareRecord share = makeFinished(10, linkHash);
    NewShare again = shareOf({}, 1000);
    again.reshareOf = share.key;
    const ShareRecord reshare = m_store->createShare(again).share;
    ASSERT_TRUE(m_store->resetUpload(m_account, reshare.files[0].upload, 1000));
    EXPECT_THAT(m_store->doomedBlobs(), IsEmpty());
    EXPECT_TRUE(m_store->findLink(linkHash, 1000)->share.files[0].complete());
}

TEST_P(MetadataSuite, ARemovedAccountTakesItsSharesAlong)
{
    const ShareRecord share = makeFinished(10, linkHash);
    EXPECT_TRUE(m_store->removeAccount("+491"));
    EXPECT_FALSE(m_store->removeAccount("+491"));
    EXPECT_FALSE(m_store->findAccount(tokenHash));
    EXPECT_FALSE(m_store->findLink(linkHash, 1000));
    EXPECT_THAT(m_store->doomedBlobs(), ElementsAre(share.files[0].blob));
    EXPECT_FALSE(m_store->recordOffset(share.files[0].blob, 11));
}

TEST_P(MetadataSuite, EndedSharesAreForgottenAfterTheirTime)
{
    const ShareRecord expired = makeFinished(10, linkHash);
    const ShareRecord withdrawn = make({20}, 1100);
    const ShareRecord live = make({30}, 1100);
    EXPECT_EQ(m_store->earliestEnd(), std::nullopt);
    m_store->withdrawShare(m_account, withdrawn.key, 1150);
    m_store->expireShares(1200);
    EXPECT_EQ(m_store->earliestEnd(), 1150);
    m_store->forgetEnded(1149, 0);
    EXPECT_TRUE(m_store->findShare(m_account, withdrawn.key, 1200));
    m_store->forgetEnded(1150, 0);
    EXPECT_FALSE(m_store->findShare(m_account, withdrawn.key, 1200));
    EXPECT_TRUE(m_store->findLink(linkHash, 1200));
    EXPECT_EQ(m_store->earliestEnd(), 1200);
    m_store->forgetEnded(1300, 0);
    EXPECT_FALSE(m_store->findLink(linkHash, 1300));
    EXPECT_FALSE(m_store->findShare(m_account, expired.key, 1300));
    EXPECT_TRUE(m_store->findShare(m_account, live.key, 1300));
    EXPECT_EQ(m_store->earliestEnd(), std::nullopt);
    // The bytes are doomed all the same until they are gone.
    EXPECT_THAT(m_store->doomedBlobs(), SizeIs(2));
}

TEST_P(MetadataSuite, OldUsesAreForgottenApartFromTheirShares)
{
    make({10}, 1000);
    make({20}, 1050);
    m_store->forgetEnded(0, 1000);
    EXPECT_EQ(m_store->usedBytes(m_account, 0), 20U);
}

TEST_P(MetadataSuite, ABlobIsKnownUntilItIsForgotten)
{
    const ShareRecord share = make({10});
    const std::string blob = share.files[0].blob;
    EXPECT_THAT(m_store->unknownBlobs({blob}), IsEmpty());
    const std::string other(22, 'A');
    EXPECT_THAT(m_store->unknownBlobs({other, blob}), ElementsAre(other));
    m_store->withdrawShare(m_account, share.key, 1000);
    EXPECT_THAT(m_store->unknownBlobs({blob}), IsEmpty());
    m_store->forgetBlob(blob);
    EXPECT_THAT(m_store->unknownBlobs({blob, other}), ElementsAre(blob, other));
}

} // namespace pelliko::server
