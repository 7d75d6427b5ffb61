#include "pages/ByteRange.h"

#include <gtest/gtest.h>

namespace pelliko::server
{
namespace
{

using Kind = ByteRange::Kind;

struct Case {
    const char *header;
    std::uint64_t size;
    Kind kind;
    std::uint64_t offset;
    std::uint64_t length;
};

TEST(ByteRange, EveryFormOfTheHeader)
{
    const Case cases[] = {
        {"bytes=0-0", 10, Kind::part, 0, 1},
        {"bytes=2-5", 10, Kind::part, 2, 4},
        {"bytes=2-", 10, Kind::part, 2, 8},
        {"bytes=2-99", 10, Kind::part, 2, 8},
        {"bytes=-3", 10, Kind::part, 7, 3},
        {"bytes=-99", 10, Kind::part, 0, 10},
        {"Bytes=1-1", 10, Kind::part, 1, 1},
        {"bytes=10-", 10, Kind::unsatisfiable, 0, 0},
        {"bytes=99-100", 10, Kind::unsatisfiable, 0, 0},
        {"bytes=-0", 10, Kind::unsatisfiable, 0, 0},
        {"bytes=0-", 0, Kind::unsatisfiable, 0, 0},
        {"bytes=-1", 0, Kind::unsatisfiable, 0, 0},
        // Not for us, or not understood: the whole file.
        {"bytes=0-1,3-4", 10, Kind::whole, 0, 10},
        {"items=0-1", 10, Kind::whole, 0, 10},
        {"bytes=5-2", 10, Kind::whole, 0, 10},
        {"bytes=-", 10, Kind::whole, 0, 10},
        {"bytes=a-b", 10, Kind::whole, 0, 10},
        {"bytes=1", 10, Kind::whole, 0, 10},
        {"bytes=--1", 10, Kind::whole, 0, 10},
        {"bytes=0-18446744073709551616", 10, Kind::whole, 0, 10},
        {"", 10, Kind::whole, 0, 10},
        // The largest number that fits must not wrap.
        {"bytes=0-18446744073709551615", 10, Kind::part, 0, 10},
    };
    for (const Case &c : cases) {
        const ByteRange range = parseRange(c.header, c.size);
        EXPECT_EQ(range.kind, c.kind) << c.header;
        EXPECT_EQ(range.offset, c.offset) << c.header;
        EXPECT_EQ(range.length, c.length) << c.header;
    }
}

} // namespace
} // namespace pelliko::server
