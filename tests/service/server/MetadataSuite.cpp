#include "MetadataSuite.h"

#include <gmock/gmock.h>

namespace pelliko::server
{

using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;
using Created = CreateResult::Outcome;
using Finished = FinishResult::Outcome;

void MetadataSuite::SetUp()
{
    m_store = GetParam().fresh();
    ASSERT_TRUE(m_store->addAccount("+491", "Anna", tokenHash, 900));
    m_account = m_store->findAccount(tokenHash)->id;
}

NewShare MetadataSuite::shareOf(std::vector<std::uint64_t> sizes, Seconds now) const
{
    NewShare share;
    share.account = m_account;
    for (std::uint64_t size : sizes)
        share.files.push_back({"file", "text/plain", size});
    share.recipients = {{"+492", "49"}, {"+493", ""}};
    share.now = now;
    share.deadline = now + 700;
    share.dailyLimit = 2000;
    share.limitWindow = 100;
    return share;
}

ShareRecord MetadataSuite::make(std::vector<std::uint64_t> sizes, Seconds now)
{
    const CreateResult result = m_store->createShare(shareOf(std::move(sizes), now));
    EXPECT_EQ(result.outcome, Created::created);
    return result.share;
}

ShareRecord MetadataSuite::makeFinished(std::uint64_t size, const std::string &hash, Seconds now)
{
    const ShareRecord share = make({size}, now);
    EXPECT_TRUE(m_store->recordOffset(share.files[0].blob, size));
    const FinishResult result = m_store->finishShare(m_account, share.key, hash, now, now + 200);
    EXPECT_EQ(result.outcome, Finished::finished);
    return result.share;
}

TEST_P(MetadataSuite, AnAccountIsFoundByItsTokenOnly)
{
    const auto account = m_store->findAccount(tokenHash);
    ASSERT_TRUE(account);
    EXPECT_EQ(account->number, "+491");
    EXPECT_EQ(account->name, "Anna");
    EXPECT_FALSE(m_store->findAccount(std::string(32, '\x09')));
    EXPECT_FALSE(m_store->findAccount(""));
}

TEST_P(MetadataSuite, ANumberHasOneAccount)
{
    EXPECT_FALSE(m_store->addAccount("+491", "Berta", std::string(32, '\x05'), 950));
    EXPECT_TRUE(m_store->addAccount("+492", "Berta", std::string(32, '\x05'), 950));
    EXPECT_THAT(m_store->listAccounts(), SizeIs(2));
}

TEST_P(MetadataSuite, WhoHasJoinedIsToldForExactlyTheNumbersAskedFor)
{
    ASSERT_TRUE(m_store->addAccount("+4915112345678", "Berta", std::string(32, '\x05'), 950));
    ASSERT_TRUE(m_store->addAccount("+447700900123", "Carl", std::string(32, '\x06'), 950));
    const JoinedQuestion question{
        m_account, {"+15550000001", "+447700900123", "+4915112345678", "+491511234567"}, 1000, 10};
    const JoinedAnswer answer = m_store->askJoined(question);
    EXPECT_TRUE(answer.allowed);
    EXPECT_THAT(answer.joined, ElementsAre("+447700900123", "+4915112345678"));
    m_store->removeAccount("+447700900123");
    EXPECT_THAT(m_store->askJoined(question).joined, ElementsAre("+4915112345678"));
}

TEST_P(MetadataSuite, QuestionsAboutNumbersAreCountedWithinTheWindow)
{
    const auto ask = [&](std::size_t count, Seconds now, std::int64_t account) {
        return m_store->askJoined(
            {account, std::vector<std::string>(count, "+15550000001"), now, 5, 100});
    };
    EXPECT_TRUE(ask(2, 1000, m_account).allowed);
    EXPECT_TRUE(ask(1, 1000, m_account).allowed) << "in the same second";
    m_store.reset();
    m_store = GetParam().again();
    EXPECT_TRUE(ask(2, 1040, m_account).allowed) << "up to the limit";
    const JoinedAnswer refused = ask(1, 1050, m_account);
    EXPECT_FALSE(refused.allowed);
    EXPECT_THAT(refused.joined, IsEmpty());
    EXPECT_EQ(refused.retryAfter, 50);
    EXPECT_EQ(ask(4, 1050, m_account).retryAfter, 90) << "needs the second question's end too";
    EXPECT_EQ(ask(6, 1050, m_account).retryAfter, 100) << "never fits";
    ASSERT_TRUE(m_store->addAccount("+492", "Berta", std::string(32, '\x05'), 950));
    EXPECT_TRUE(ask(5, 1050, m_store->findAccount(std::string(32, '\x05'))->id).allowed)
        << "each account has a limit of its own";
    EXPECT_FALSE(ask(1, 1099, m_account).allowed);
    EXPECT_TRUE(ask(3, 1100, m_account).allowed) << "refused questions did not count";
}

TEST_P(MetadataSuite, OldQuestionsAreForgotten)
{
    const JoinedQuestion question{m_account, {"+15550000001"}, 1000, 1, 100};
    EXPECT_TRUE(m_store->askJoined(question).allowed);
    m_store->forgetEnded(0, 999);
    EXPECT_FALSE(m_store->askJoined(question).allowed);
    m_store->forgetEnded(0, 1000);
    EXPECT_TRUE(m_store->askJoined(question).allowed);
}

TEST_P(MetadataSuite, EverythingIsThereAfterARestart)
{
    const ShareRecord share = makeFinished(10, linkHash);
    m_store.reset();
    m_store = GetParam().again();
    const auto link = m_store->findLink(linkHash, 1000);
    ASSERT_TRUE(link);
    EXPECT_EQ(link->share.key, share.key);
    EXPECT_EQ(link->share.files.at(0).offset, 10U);
    EXPECT_EQ(link->senderNumber, "+491");
}

TEST_P(MetadataSuite, ASecondProcessSeesAndAddsAtTheSameTime)
{
    const auto other = GetParam().again();
    ASSERT_TRUE(other->addAccount("+499", "", std::string(32, '\x07'), 950));
    EXPECT_TRUE(m_store->findAccount(std::string(32, '\x07')));
}

TEST_P(MetadataSuite, ANewShareKeepsItsOrder)
{
    const ShareRecord share = make({3, 0, 5});
    ASSERT_THAT(share.files, SizeIs(3));
    EXPECT_EQ(share.files[2].size, 5U);
    EXPECT_FALSE(share.files[0].complete());
    EXPECT_TRUE(share.files[1].complete()) << "an empty file is complete at once";
    ASSERT_THAT(share.recipients, SizeIs(2));
    EXPECT_EQ(share.recipients[1].number, "+493");
    EXPECT_EQ(share.state, ShareState::uploading);
    EXPECT_EQ(share.deadline, 1700);
}

TEST_P(MetadataSuite, TheSameKeyGivesTheSameShare)
{
    NewShare share = shareOf({5});
    share.idempotencyKey = "once";
    const CreateResult first = m_store->createShare(share);
    const CreateResult second = m_store->createShare(share);
    EXPECT_EQ(second.outcome, Created::known);
    EXPECT_EQ(second.share.key, first.share.key);
    EXPECT_EQ(m_store->usedBytes(m_account, 0), 5U);
    ASSERT_TRUE(m_store->addAccount("+492", "", std::string(32, '\x05'), 950));
    share.account = m_store->findAccount(std::string(32, '\x05'))->id;
    EXPECT_EQ(m_store->createShare(share).outcome, Created::created)
        << "another account's key is another key";
}

TEST_P(MetadataSuite, SharesWithoutAKeyAreAllDifferent)
{
    EXPECT_NE(make({1}).key, make({1}).key);
    EXPECT_THAT(m_store->listShares(m_account, 1000), SizeIs(2));
}

TEST_P(MetadataSuite, TheDailyLimitHoldsToTheByteAndTheSecond)
{
    make({1200}, 1000);
    make({800}, 1010);
    const CreateResult refused = m_store->createShare(shareOf({1}, 1050));
    EXPECT_EQ(refused.outcome, Created::overDailyLimit);
    EXPECT_EQ(refused.retryAfter, 50);
    EXPECT_EQ(m_store->createShare(shareOf({1201}, 1050)).retryAfter, 60);
    EXPECT_EQ(m_store->createShare(shareOf({1}, 1099)).outcome, Created::overDailyLimit);
    EXPECT_EQ(m_store->createShare(shareOf({1}, 1100)).outcome, Created::created);
}

TEST_P(MetadataSuite, AnOffsetNeverGoesBack)
{
    const ShareRecord share = make({10});
    const std::string blob = share.files[0].blob;
    EXPECT_TRUE(m_store->recordOffset(blob, 7));
    EXPECT_TRUE(m_store->recordOffset(blob, 4));
    EXPECT_EQ(m_store->findUpload(m_account, share.files[0].upload, 1000)->file.offset, 7U);
    EXPECT_FALSE(m_store->recordOffset("unknown", 1));
}

TEST_P(MetadataSuite, AnUploadIsItsAccountsOwn)
{
    const ShareRecord share = make({10});
    ASSERT_TRUE(m_store->addAccount("+492", "", std::string(32, '\x05'), 950));
    const std::int64_t other = m_store->findAccount(std::string(32, '\x05'))->id;
    EXPECT_TRUE(m_store->findUpload(m_account, share.files[0].upload, 1000));
    EXPECT_FALSE(m_store->findUpload(other, share.files[0].upload, 1000));
    EXPECT_FALSE(m_store->findShare(other, share.key, 1000));
    EXPECT_FALSE(m_store->withdrawShare(other, share.key, 1000));
    EXPECT_EQ(m_store->finishShare(other, share.key, linkHash, 1000, 1200).outcome,
              Finished::missing);
}

TEST_P(MetadataSuite, ADroppedUploadStartsAgainAndStillCounts)
{
    const ShareRecord share = make({10});
    ASSERT_TRUE(m_store->recordOffset(share.files[0].blob, 7));
    ASSERT_TRUE(m_store->resetUpload(m_account, share.files[0].upload, 1000));
    const auto upload = m_store->findUpload(m_account, share.files[0].upload, 1000);
    EXPECT_EQ(upload->file.offset, 0U);
    EXPECT_THAT(m_store->doomedBlobs(), ElementsAre(share.files[0].blob));
    EXPECT_FALSE(m_store->recordOffset(share.files[0].blob, 8)) << "the old bytes are not wanted";
    EXPECT_EQ(m_store->usedBytes(m_account, 0), 17U);
}

TEST_P(MetadataSuite, AFinishedSharesFilesAreNotDropped)
{
    const ShareRecord share = makeFinished(10, linkHash);
    EXPECT_FALSE(m_store->resetUpload(m_account, share.files[0].upload, 1000));
}

TEST_P(MetadataSuite, ALinkTellsFilesAndRecipientsInTheirOrder)
{
    NewShare wanted = shareOf({}, 1000);
    // More than ten, so that an order by text would be another.
    for (int number = 11; number >= 0; --number)
        wanted.files.push_back({"file" + std::to_string(number), "image/jpeg", 0});
    wanted.recipients = {{"+493", "49"}, {"+492", ""}, {"+494", "7"}};
    const ShareRecord share = m_store->createShare(wanted).share;
    m_store->finishShare(m_account, share.key, linkHash, 1000, 1200);
    const ShareRecord found = m_store->findLink(linkHash, 1000)->share;
    ASSERT_THAT(found.files, SizeIs(wanted.files.size()));
    for (std::size_t at = 0; at < wanted.files.size(); ++at) {
        EXPECT_EQ(found.files[at].name, wanted.files[at].name);
        EXPECT_EQ(found.files[at].upload, share.files[at].upload);
        EXPECT_EQ(found.files[at].blob, share.files[at].blob);
    }
    ASSERT_THAT(found.recipients, SizeIs(3));
    EXPECT_EQ(found.recipients[0].number, "+493");
    EXPECT_EQ(found.recipients[1].callingCode, "");
    EXPECT_EQ(found.recipients[2].callingCode, "7");
}

TEST_P(MetadataSuite, FinishNeedsEveryByte)
{
    const ShareRecord share = make({10, 5});
    ASSERT_TRUE(m_store->recordOffset(share.files[0].blob, 10));
    ASSERT_TRUE(m_store->recordOffset(share.files[1].blob, 4));
    EXPECT_EQ(m_store->finishShare(m_account, share.key, linkHash, 1000, 1200).outcome,
              Finished::incomplete);
    EXPECT_FALSE(m_store->findLink(linkHash, 1000));
}

TEST_P(MetadataSuite, FinishingAgainReplacesTheLinkAndKeepsTheEnd)
{
    const ShareRecord share = makeFinished(10, linkHash);
    const FinishResult again =
        m_store->finishShare(m_account, share.key, otherLinkHash, 1100, 1300);
    EXPECT_EQ(again.outcome, Finished::finished);
    EXPECT_EQ(again.share.deadline, 1200);
    EXPECT_FALSE(m_store->findLink(linkHash, 1100));
    EXPECT_TRUE(m_store->findLink(otherLinkHash, 1100));
}

} // namespace pelliko::server
