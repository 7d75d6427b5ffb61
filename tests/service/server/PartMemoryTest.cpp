#include "store/PartBuffer.h"
#include "store/S3Layout.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

namespace pelliko::server
{
namespace
{

/// What the kernel has been told about the memory there: the words of its VmFlags.
std::string flagsOf(const char *memory)
{
    const auto address = reinterpret_cast<std::uintptr_t>(memory);
    std::ifstream maps("/proc/self/smaps");
    bool isThere = false;
    for (std::string line; std::getline(maps, line);) {
        std::uintptr_t begin = 0;
        std::uintptr_t end = 0;
        char dash = 0;
        std::istringstream words(line);
        if (words >> std::hex >> begin >> dash >> end && dash == '-')
            isThere = begin <= address && address < end;
        else if (isThere && line.rfind("VmFlags:", 0) == 0)
            return line + " ";
    }
    return {};
}

TEST(PartMemory, TheRoomThatCameBackLastIsTakenFirst)
{
    PartMemory memory;
    auto first = memory.take();
    auto second = memory.take();
    const char *const last = second.get();
    first.reset();
    second.reset();
    EXPECT_EQ(memory.kept(), 2U);
    EXPECT_EQ(memory.take().get(), last);
}

TEST(PartMemory, NoMoreRoomsWaitThanItKeeps)
{
    PartMemory memory;
    std::vector<PartMemory::Room> rooms;
    for (std::size_t count = 0; count < PartMemory::mostKept + 2; ++count)
        rooms.push_back(memory.take());
    rooms.clear();
    EXPECT_EQ(memory.kept(), PartMemory::mostKept);
}

TEST(PartMemory, ARoomIsOfHugePages)
{
    if (!std::filesystem::exists("/sys/kernel/mm/transparent_hugepage"))
        GTEST_SKIP() << "this kernel has none";
    PartMemory memory;
    const auto room = memory.take();
    EXPECT_NE(flagsOf(room.get() + s3PartSize / 2).find(" hg "), std::string::npos);
}

TEST(PartBuffer, BytesStayWhenItGrowsIntoARoom)
{
    PartMemory memory;
    PartBuffer buffer(memory);
    std::string all;
    for (char letter = 'a'; all.size() < s3PartSize; letter = letter == 'z' ? 'a' : ++letter) {
        const std::string piece(64UL * 1024, letter);
        buffer.append(piece);
        all += piece;
    }
    EXPECT_EQ(buffer.size(), s3PartSize);
    EXPECT_EQ(buffer.view(), all);
    buffer.truncate(5);
    EXPECT_EQ(buffer.view(), "aaaaa");
    buffer.append("b");
    EXPECT_EQ(buffer.view(), "aaaaab");
}

TEST(PartBuffer, AFewBytesTakeNoRoom)
{
    PartMemory memory;
    {
        const PartBuffer small(memory, "some", 1000);
        EXPECT_EQ(small.view(), "some");
        const PartBuffer none(memory);
        EXPECT_TRUE(none.empty());
        EXPECT_EQ(none.view(), "");
    }
    EXPECT_EQ(memory.kept(), 0U);
    {
        const PartBuffer large(memory, "some", s3PartSize - 4);
        EXPECT_EQ(large.view(), "some");
    }
    EXPECT_EQ(memory.kept(), 1U);
}

} // namespace
} // namespace pelliko::server
