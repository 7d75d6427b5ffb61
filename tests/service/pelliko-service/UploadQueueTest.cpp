#include "UploadQueue.h"

#include "Fakes.h"

#include <gmock/gmock.h>
#include <sqlite3.h>

using namespace pelliko::service;
using testing::ElementsAre;
using testing::IsEmpty;

namespace
{
struct Queue : testing::Test {
    Folder folder;
    std::unique_ptr<UploadQueue> queue = std::make_unique<UploadQueue>(folder.file("queue.db"));

    void reopen()
    {
        queue.reset();
        queue = std::make_unique<UploadQueue>(folder.file("queue.db"));
    }
    int32_t add()
    {
        return queue->add({{{"/a b\xff.jpg", {10, 20}}, {"/c", {-1, 0}}},
                           {{"44", "+441", 31}, {"", "+442", 32}},
                           true,
                           {},
                           100});
    }
};
} // namespace

TEST_F(Queue, keepsARequestWithEverythingThatItNeeds)
{
    const int32_t id = add();
    reopen();
    const auto request = queue->find(id);
    ASSERT_TRUE(request);
    EXPECT_EQ(request->state, RequestState::uploading);
    EXPECT_TRUE(request->wifiOnly);
    EXPECT_EQ(request->key.size(), 22U);
    ASSERT_EQ(request->files.size(), 2U);
    EXPECT_EQ(request->files[0].path, "/a b\xff.jpg");
    EXPECT_EQ(request->files[0].stamp, (FileStamp{10, 20}));
    ASSERT_EQ(request->recipients.size(), 2U);
    EXPECT_EQ(request->recipients[1].number, "+442");
    EXPECT_EQ(request->recipients[1].numberId, 32);
    EXPECT_THAT(queue->openIds(), ElementsAre(id));
}

TEST_F(Queue, neverUsesAnIdAgain)
{
    const int32_t first = add();
    queue->setEnded(first, 7, 0, false, 100);
    queue->setDelivered(first);
    queue->forgetBefore(1000);
    EXPECT_FALSE(queue->find(first));
    reopen();
    EXPECT_GT(add(), first);
}

TEST_F(Queue, idsEndWhereThirtyTwoBitsEnd)
{
    sqlite3 *db = nullptr;
    ASSERT_EQ(sqlite3_open(folder.file("queue.db").c_str(), &db), SQLITE_OK);
    sqlite3_exec(db, "INSERT INTO sqlite_sequence VALUES ('requests', 2147483646)", nullptr,
                 nullptr, nullptr);
    sqlite3_close(db);
    EXPECT_EQ(add(), 2147483647);
    EXPECT_THROW(add(), std::exception);
}

TEST_F(Queue, aRequestEndsOnce)
{
    const int32_t id = add();
    queue->setEnded(id, 5, 0, true, 100);
    queue->setEnded(id, 4, -7, false, 200);
    EXPECT_EQ(queue->find(id)->endStatus, 5);
    EXPECT_EQ(queue->find(id)->error, 0);
    EXPECT_THAT(queue->withdrawals(), ElementsAre(id));
}

TEST_F(Queue, anEndIsOpenUntilItWasDelivered)
{
    const int32_t id = add();
    queue->setEnded(id, 7, 0, false, 100);
    reopen();
    EXPECT_THAT(queue->openIds(), ElementsAre(id));
    queue->setDelivered(id);
    EXPECT_THAT(queue->openIds(), IsEmpty());
}

TEST_F(Queue, theLinkIsKeptOnlyUntilTheMessagesAreSent)
{
    const int32_t id = add();
    queue->setFinished(id, {"http://s/abc", 500, {"+441"}});
    reopen();
    EXPECT_EQ(queue->find(id)->url, "http://s/abc");
    EXPECT_EQ(queue->find(id)->smsState, SmsState::wanted);
    EXPECT_THAT(queue->find(id)->smsNumbers, ElementsAre("+441"));
    queue->setEnded(id, 7, 0, false, 600);
    EXPECT_EQ(queue->find(id)->url, "");
    EXPECT_EQ(queue->find(id)->expires, 500);
}

TEST_F(Queue, aQueueOfANewerProgramIsLeftAlone)
{
    sqlite3 *db = nullptr;
    ASSERT_EQ(sqlite3_open(folder.file("queue.db").c_str(), &db), SQLITE_OK);
    sqlite3_exec(db, "PRAGMA user_version = 99", nullptr, nullptr, nullptr);
    sqlite3_close(db);
    EXPECT_THROW(reopen(), std::exception);
}

TEST_F(Queue, aDamagedFileIsKeptAsideAndNoIdIsUsedAgain)
{
    const int32_t before = add();
    queue.reset();
    const std::string file = folder.file("queue.db");
    const auto damage = [&](std::streamoff place) {
        std::fstream bytes(file, std::ios::in | std::ios::out | std::ios::binary);
        bytes.seekp(place);
        bytes << std::string(2000, 'x');
    };
    for (const std::streamoff place : {4096, 0}) { // a page in the middle, then the head
        damage(place);
        const auto size = std::filesystem::file_size(file);
        reopen();
        EXPECT_THAT(queue->openIds(), IsEmpty());
        EXPECT_GT(add(), before);
        EXPECT_EQ(std::filesystem::file_size(file + ".broken"), size);
        queue.reset();
    }
    reopen();
    EXPECT_EQ(queue->openIds().size(), 1U) << "a sound one stays";
}

TEST_F(Queue, keysAreRandom)
{
    EXPECT_NE(randomKey(), randomKey());
}

TEST_F(Queue, keepsWhatWasFoundOutBesideWhatTheClientSaid)
{
    const int32_t id = add();
    auto recipients = queue->find(id)->recipients;
    recipients[0].e164 = "+447700900111";
    recipients[0].joined = Joined::yes;
    recipients[1].fault = "too_short";
    queue->setFindings(id, recipients);
    reopen();
    recipients = queue->find(id)->recipients;
    EXPECT_EQ(recipients[0].number, "+441");
    EXPECT_EQ(recipients[0].e164, "+447700900111");
    EXPECT_EQ(recipients[0].joined, Joined::yes);
    EXPECT_EQ(recipients[1].fault, "too_short");
    EXPECT_EQ(recipients[1].joined, Joined::unknown);
}

TEST_F(Queue, whatIsForgottenGoesWhenNothingIsLeftToDo)
{
    const int32_t id = add();
    queue->forget(id); // has not ended
    EXPECT_THAT(queue->shownIds(), ElementsAre(id));
    queue->setEnded(id, 7, 0, false, 100);
    queue->setWithdrawn(id);
    EXPECT_THAT(queue->withdrawals(), ElementsAre(id));
    queue->forget(id);
    EXPECT_THAT(queue->shownIds(), testing::IsEmpty());
    EXPECT_TRUE(queue->find(id)->withdrawn);
    queue->withdrawalDone(id);
    EXPECT_TRUE(queue->find(id)) << "no client has heard its end";
    queue->setDelivered(id);
    EXPECT_FALSE(queue->find(id));
}

TEST_F(Queue, aQueueOfTheFirstLayoutIsTakenOver)
{
    const int32_t id = add();
    queue.reset();
    sqlite3 *db = nullptr;
    ASSERT_EQ(sqlite3_open(folder.file("queue.db").c_str(), &db), SQLITE_OK);
    ASSERT_EQ(sqlite3_exec(db,
                           "ALTER TABLE recipients DROP COLUMN e164;"
                           "ALTER TABLE recipients DROP COLUMN fault;"
                           "ALTER TABLE recipients DROP COLUMN joined;"
                           "ALTER TABLE requests DROP COLUMN withdrawn;"
                           "ALTER TABLE requests DROP COLUMN forgotten;"
                           "DROP TABLE push_positions; DROP TABLE received_files;"
                           "DROP TABLE received; DROP TABLE joined_numbers;"
                           "DROP TABLE joined_questions;"
                           "PRAGMA user_version = 1",
                           nullptr, nullptr, nullptr),
              SQLITE_OK);
    sqlite3_close(db);
    reopen();
    const auto request = queue->find(id);
    ASSERT_EQ(request->recipients.size(), 2U);
    EXPECT_EQ(request->recipients[0].ccc, "44");
    EXPECT_EQ(request->recipients[1].number, "+442");
    EXPECT_EQ(request->recipients[1].e164, "");
    EXPECT_EQ(request->recipients[1].joined, Joined::unknown);
    EXPECT_GT(add(), id);
}
