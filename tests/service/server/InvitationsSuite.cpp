#include "MetadataSuite.h"

#include <gmock/gmock.h>

#include <thread>

namespace pelliko::server
{

using testing::IsEmpty;
using testing::SizeIs;
using Result = RegisterResult;

namespace
{

const std::string code(32, '\x11');
const std::string key(32, '\x21');

std::string hash(char c)
{
    return std::string(32, c);
}

Registration wish(const std::string &number, char token, Seconds now = 1000)
{
    return {code, number, hash(token), hash(token), now};
}

} // namespace

TEST_P(MetadataSuite, ACodeMakesAsManyAccountsAsItHasUses)
{
    m_store->addInvitation({code, "", 2, 900, 2000});
    EXPECT_EQ(m_store->registerAccount(wish("+4915111", 'a')), Result::registered);
    EXPECT_EQ(m_store->registerAccount(wish("+4915112", 'b')), Result::registered);
    EXPECT_EQ(m_store->registerAccount(wish("+4915113", 'c')), Result::codeUsedUp);
    EXPECT_EQ(m_store->findAccount(hash('b'))->number, "+4915112");
    EXPECT_EQ(m_store->findAccount(hash('b'))->created, 1000);
    EXPECT_FALSE(m_store->findAccount(hash('c')));
    EXPECT_EQ(GetParam().again()->listInvitations()[0].used, 2);
}

TEST_P(MetadataSuite, ACodeThatIsUnknownOrExpiredMakesNothing)
{
    EXPECT_EQ(m_store->registerAccount(wish("+4915111", 'a')), Result::codeUnknown);
    m_store->addInvitation({code, "", 2, 900, 2000});
    EXPECT_EQ(m_store->registerAccount(wish("+4915111", 'a', 2000)), Result::codeExpired);
    EXPECT_EQ(m_store->registerAccount(wish("+4915111", 'a', 1999)), Result::registered);
    EXPECT_THAT(m_store->listAccounts(), SizeIs(2));
}

TEST_P(MetadataSuite, ATakenNumberUsesNothingUp)
{
    m_store->addInvitation({code, "", 1, 900, 2000});
    EXPECT_EQ(m_store->registerAccount(wish("+491", 'a')), Result::numberTaken);
    EXPECT_EQ(m_store->listInvitations()[0].used, 0);
    EXPECT_EQ(m_store->registerAccount(wish("+492", 'b')), Result::registered);
}

TEST_P(MetadataSuite, ALostAnswerIsAskedForAgain)
{
    m_store->addInvitation({code, "", 1, 900, 2000});
    Registration again = wish("+4915111", 'a');
    EXPECT_EQ(m_store->registerAccount(again), Result::registered);
    again.tokenHash = hash('b');
    again.now = 5000;
    EXPECT_EQ(m_store->registerAccount(again), Result::registered);
    EXPECT_FALSE(m_store->findAccount(hash('a')));
    EXPECT_EQ(m_store->findAccount(hash('b'))->number, "+4915111");
    again.keyHash = key;
    EXPECT_EQ(m_store->registerAccount(again), Result::codeUsedUp) << "somebody else's attempt";
    again.keyHash = hash('a');
    again.number = "+491";
    EXPECT_EQ(m_store->registerAccount(again), Result::codeUsedUp) << "another number";
}

TEST_P(MetadataSuite, ARenewalMovesTheAccountToAnotherToken)
{
    const ShareRecord share = make({5});
    const std::string before = hash('\x01');
    m_store->addInvitation({code, "+491", 1, 900, 2000});
    EXPECT_EQ(m_store->registerAccount(wish("+4915111", 'a')), Result::codeForOther);
    EXPECT_EQ(m_store->registerAccount(wish("+491", 'b')), Result::registered);
    EXPECT_FALSE(m_store->findAccount(before));
    EXPECT_EQ(m_store->findAccount(hash('b'))->id, m_account);
    EXPECT_TRUE(m_store->findShare(m_account, share.key, 1001));
    EXPECT_EQ(m_store->registerAccount(wish("+491", 'c')), Result::codeUsedUp);
}

TEST_P(MetadataSuite, ARenewalOfARemovedAccountMakesNone)
{
    m_store->addInvitation({code, "+491", 1, 900, 2000});
    ASSERT_TRUE(m_store->removeAccount("+491"));
    EXPECT_EQ(m_store->registerAccount(wish("+491", 'b')), Result::codeUnknown);
    EXPECT_THAT(m_store->listAccounts(), IsEmpty());
}

TEST_P(MetadataSuite, TwoAtOnceOnTheLastUseAreOneAccount)
{
    m_store->addInvitation({code, "", 1, 900, 2000});
    const auto other = GetParam().again();
    Result first = Result::codeUnknown;
    Result second = Result::codeUnknown;
    std::thread thread([&] { first = m_store->registerAccount(wish("+4915111", 'a')); });
    second = other->registerAccount(wish("+4915112", 'b'));
    thread.join();
    EXPECT_NE(first == Result::registered, second == Result::registered);
    EXPECT_EQ(first == Result::registered ? second : first, Result::codeUsedUp);
    EXPECT_THAT(m_store->listAccounts(), SizeIs(2));
}

TEST_P(MetadataSuite, InvitationsAreListedRevokedAndForgotten)
{
    EXPECT_FALSE(m_store->removeInvitation(1));
    m_store->addInvitation({code, "", 1, 900, 2000});
    m_store->addInvitation({key, "+491", 1, 950, 3000});
    const auto list = m_store->listInvitations();
    ASSERT_THAT(list, SizeIs(2));
    EXPECT_EQ(list[1].number, "+491");
    EXPECT_EQ(list[1].created, 950);
    EXPECT_EQ(list[1].expires, 3000);
    EXPECT_TRUE(m_store->removeInvitation(list[1].id));
    m_store->forgetInvitations(1999);
    EXPECT_THAT(m_store->listInvitations(), SizeIs(1));
    EXPECT_EQ(m_store->registerAccount(wish("+4915111", 'a')), Result::registered);
    m_store->forgetInvitations(2000);
    EXPECT_THAT(m_store->listInvitations(), IsEmpty());
    EXPECT_TRUE(m_store->findAccount(hash('a'))) << "the account stays";
    EXPECT_TRUE(m_store->removeAccount("+4915111"));
}

} // namespace pelliko::server
