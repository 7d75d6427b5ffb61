#include "ServerEvents.h"

#include <gmock/gmock.h>

#include <vector>

using namespace pelliko::service;

namespace
{
class Events : public testing::Test
{
protected:
    std::vector<ServerEvent> seen;
    ServerEvents events{[this](const ServerEvent &event) { seen.push_back(event); }};
};
} // namespace

TEST_F(Events, areTheSameHoweverTheyAreCutIntoPieces)
{
    const std::string stream = ": hello\n\nid: 17\nevent: share\ndata: {\"a\":1}\n\n";
    for (size_t size = 1; size <= stream.size(); ++size) {
        seen.clear();
        for (size_t i = 0; i < stream.size(); i += size) {
            ASSERT_TRUE(events.take(stream.substr(i, size)));
        }
        ASSERT_EQ(seen.size(), 1U) << size;
        EXPECT_EQ(seen[0].id, "17");
        EXPECT_EQ(seen[0].type, "share");
        EXPECT_EQ(seen[0].data, "{\"a\":1}");
    }
}

TEST_F(Events, mayEndTheirLinesInAnyWayAndSayMoreThanIsKnown)
{
    events.take("id:1\r\nnew: x\r\nevent:share\rdata:one\ndata: two\r\n\r\nevent: other\n\n");
    ASSERT_EQ(seen.size(), 1U) << "an event without data is none";
    EXPECT_EQ(seen[0].data, "one\ntwo");
    events.take("data: three\n\n");
    ASSERT_EQ(seen.size(), 2U);
    EXPECT_EQ(seen[1].id, "1") << "an id holds until the next";
    EXPECT_EQ(seen[1].type, "");
}

TEST_F(Events, aLineWithoutAnEndIsNotGathered)
{
    EXPECT_TRUE(events.take(std::string(60'000, 'x')));
    EXPECT_FALSE(events.take(std::string(60'000, 'x')));
    EXPECT_FALSE(events.take("\ndata: late\n\n"));
    EXPECT_TRUE(seen.empty());
}
