#include "ReceivedJournal.h"
#include "Fakes.h"

#include <gmock/gmock.h>

using namespace pelliko::service;
using testing::ElementsAre;
using testing::IsEmpty;

namespace
{
class Journal : public testing::Test
{
protected:
    Hands hands;
    Account account = *hands.account;
    ReceivedJournal journal{hands.queue};
    ReceivedDetails details{
        "+447700900555", 900, 5'000, ReceivedState::available, {{"a.jpg", 10, "image/jpeg"}}};

    std::vector<std::string> untold()
    {
        std::vector<std::string> tokens;
        for (const auto &one : journal.untold(30)) {
            tokens.push_back(one.token);
        }
        return tokens;
    }
};
} // namespace

TEST_F(Journal, aTokenThatIsAnnouncedTwiceIsTakenInOnce)
{
    journal.announce(account, 4, "one", 1'000);
    journal.announce(account, 5, "one", 1'001);
    EXPECT_THAT(journal.unread(), ElementsAre("one"));
    EXPECT_EQ(journal.position(account).stored, 5);
    journal.setDetails("one", details);
    EXPECT_THAT(journal.unread(), IsEmpty());
    EXPECT_THAT(untold(), ElementsAre("one"));
    journal.setTold(journal.untold(30));
    journal.announce(account, 6, "one", 1'002);
    EXPECT_THAT(journal.unread(), IsEmpty());
    EXPECT_THAT(untold(), IsEmpty());
}

TEST_F(Journal, aForgottenShareLeavesNothingButItsToken)
{
    journal.announce(account, 1, "one", 1'000);
    journal.setDetails("one", details);
    journal.forget("one", true);
    EXPECT_FALSE(journal.find("one"));
    EXPECT_THAT(journal.all(), IsEmpty());
    EXPECT_THAT(untold(), IsEmpty());
    EXPECT_THAT(journal.toForgetOnServer(), ElementsAre("one"));
    journal.announce(account, 2, "one", 1'001);
    EXPECT_THAT(journal.unread(), IsEmpty());
    journal.keep("one", details, 1'002);
    EXPECT_FALSE(journal.find("one")) << "forgotten stays forgotten";
    journal.forgottenOnServer("one");
    EXPECT_THAT(journal.toForgetOnServer(), IsEmpty());
}

TEST_F(Journal, countsThePushesOfEveryAccountApart)
{
    journal.announce(account, 7, "one", 1'000);
    journal.setAcknowledged(account, 6);
    Account other = account;
    other.token = "renewed";
    EXPECT_EQ(journal.position(other).stored, 0);
    EXPECT_EQ(journal.position(account).acknowledged, 6);
    journal.forgetPosition(account);
    EXPECT_EQ(journal.position(account).stored, 0);
}

TEST_F(Journal, sharesThatHaveEndedAreNotToldToTheApplication)
{
    journal.announce(account, 1, "one", 1'000);
    details.state = ReceivedState::withdrawn;
    journal.setDetails("one", details);
    EXPECT_THAT(untold(), IsEmpty());
    ASSERT_TRUE(journal.find("one"));
    EXPECT_EQ(journal.find("one")->details.state, ReceivedState::withdrawn);
}

TEST_F(Journal, listsTheNewestFirstAndDropsTheOld)
{
    journal.announce(account, 1, "old", 1'000);
    journal.setDetails("old", details);
    journal.announce(account, 2, "new", 2'000);
    details.expires = 9'000;
    journal.setDetails("new", details);
    journal.setDetails("new", details); // asked for once more
    const auto shares = journal.all();
    ASSERT_EQ(shares.size(), 2U);
    EXPECT_EQ(shares[0].token, "new");
    ASSERT_EQ(shares[0].details.files.size(), 1U);
    EXPECT_EQ(shares[0].details.files[0].name, "a.jpg");
    EXPECT_EQ(shares[0].details.files[0].size, 10);
    journal.dropBefore(6'000);
    EXPECT_FALSE(journal.find("old"));
    EXPECT_TRUE(journal.find("new"));
}
