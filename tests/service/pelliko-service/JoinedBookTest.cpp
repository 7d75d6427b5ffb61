#include "JoinedBook.h"
#include "Fakes.h"

#include <JsonValue.h>
#include <gmock/gmock.h>

using namespace pelliko::service;
using testing::IsEmpty;
using testing::SizeIs;
using testing::UnorderedElementsAre;

namespace
{
/** A contacts store in the test's hands; reads and writes are answered by the hand timers. */
class HandMarks : public ContactMarks
{
public:
    explicit HandMarks(Timers &timers) : timers_(timers) {}

    void read(const std::string &,
              std::function<void(bool, const std::vector<ContactNumber> &)> done) override
    {
        timers_.after(0, [this, done] { done(true, numbers); });
    }
    void write(const std::vector<MarkChange> &changes, std::function<void(bool)> done) override
    {
        if (works) {
            for (const MarkChange &change : changes) {
                written.push_back(change.numberId);
                for (ContactNumber &one : numbers) {
                    one.marked = one.id == change.numberId ? change.joined : one.marked;
                }
            }
        }
        timers_.after(0, [this, done] { done(works); });
    }

    std::vector<ContactNumber> numbers;
    std::vector<int> written;
    bool works = true;

private:
    Timers &timers_;
};

class Book : public testing::Test
{
protected:
    /** Lets the book look and answers its question; @return what it asked for */
    std::vector<std::string> answer(const std::vector<std::string> &joined)
    {
        if (hands.http.open.empty()) {
            return {};
        }
        const auto question = pelliko::test::JsonValue::parse(hands.http.oldest().body)["numbers"];
        std::vector<std::string> asked;
        for (size_t i = 0; i < question.size(); ++i) {
            asked.push_back(question[i].text());
        }
        std::string list;
        for (const std::string &number : joined) {
            list.append(list.empty() ? "\"" : ",\"").append(number).append("\"");
        }
        hands.http.answer(200, "{\"joined\":[" + list + "]}");
        hands.timers.pass(0);
        return asked;
    }
    void look()
    {
        book.lookSoon();
        hands.timers.pass(2'000);
    }

    Hands hands;
    HandMarks contacts{hands.timers};
    JoinedBook book{hands.context, hands.queue, contacts};
};
} // namespace

TEST_F(Book, marksWhoHasJoinedAndAsksAgainADayLater)
{
    contacts.numbers = {
        {1, "+4411111111", false}, {2, "+4422222222", false}, {3, "+4411111111", false}};
    look();
    EXPECT_THAT(answer({"+4411111111"}), UnorderedElementsAre("+4411111111", "+4422222222"));
    EXPECT_THAT(contacts.written, UnorderedElementsAre(1, 3));
    look();
    EXPECT_THAT(hands.http.open, IsEmpty()) << "the answers are of today";
    contacts.numbers.push_back({4, "+4444444444", false});
    look();
    EXPECT_THAT(answer({}), UnorderedElementsAre("+4444444444"));
    contacts.written.clear();
    hands.timers.pass(24LL * 3600 * 1000);
    EXPECT_THAT(answer({"+4422222222"}), SizeIs(3));
    EXPECT_THAT(contacts.written, UnorderedElementsAre(1, 2, 3)) << "one has left, one has come";
    EXPECT_FALSE(contacts.numbers[0].marked);
    EXPECT_TRUE(contacts.numbers[1].marked);
}

TEST_F(Book, leavesMarksOfOthersAlone)
{
    contacts.numbers = {{1, "+4411111111", true}};
    look();
    answer({});
    EXPECT_THAT(contacts.written, IsEmpty());
}

TEST_F(Book, asksForAThousandADayAndForTheOthersLater)
{
    for (int i = 0; i < 1'500; ++i) {
        contacts.numbers.push_back({i + 1, "+44" + std::to_string(10'000'000 + i), false});
    }
    look();
    std::set<std::string> asked;
    while (!hands.http.open.empty()) {
        const auto batch = answer({});
        asked.insert(batch.begin(), batch.end());
    }
    EXPECT_THAT(asked, SizeIs(1'000));
    hands.timers.pass(3'600'000);
    EXPECT_THAT(hands.http.open, IsEmpty());
    // A question that is not answered within seconds is given up.
    for (int i = 0; i < 20'000 && hands.http.open.empty(); ++i) {
        hands.timers.pass(5'000);
    }
    std::set<std::string> next;
    while (!hands.http.open.empty()) {
        const auto batch = answer({});
        next.insert(batch.begin(), batch.end());
    }
    EXPECT_GE(next.size(), 500U);
    asked.insert(next.begin(), next.end());
    EXPECT_THAT(asked, SizeIs(1'500)) << "those without an answer come first";
}

TEST_F(Book, aRefusalIsWaitedFor)
{
    contacts.numbers = {{1, "+4411111111", false}};
    look();
    hands.http.answer(429, R"({"error":"numbers_limit"})", {{"retry-after", "7200"}});
    hands.timers.pass(7'199'000);
    EXPECT_THAT(hands.http.open, IsEmpty());
    hands.timers.pass(1'000);
    EXPECT_THAT(answer({"+4411111111"}), SizeIs(1));
    EXPECT_TRUE(contacts.numbers[0].marked);
}

TEST_F(Book, aMarkThatCouldNotBeWrittenIsWrittenLater)
{
    contacts.numbers = {{1, "+4411111111", false}};
    contacts.works = false;
    look();
    answer({"+4411111111"});
    EXPECT_FALSE(contacts.numbers[0].marked);
    contacts.works = true;
    hands.timers.pass(60'000);
    EXPECT_TRUE(contacts.numbers[0].marked);
    EXPECT_THAT(hands.http.open, IsEmpty()) << "the answer is kept";
}
