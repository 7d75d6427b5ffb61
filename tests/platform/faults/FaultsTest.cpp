#include "Faults.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <sstream>
#include <unistd.h>

// What a caller in the application is linked to instead of the C library's functions.
extern "C" {
int pelliko_fault_rename(const char *from, const char *to);
void *pelliko_fault_calloc(size_t count, size_t size);
}

namespace pelliko::platform
{
namespace
{

class Faults : public testing::Test
{
protected:
    void SetUp() override
    {
        char name[] = "/tmp/faults-XXXXXX";
        folder = mkdtemp(name);
        std::ofstream(folder + "/a");
    }
    void TearDown() override
    {
        EXPECT_EQ(planFaults(""), "");
        EXPECT_EQ(traceCalls(""), "");
        std::filesystem::remove_all(folder);
    }

    int rename(const std::string &from, const std::string &to) const
    {
        return pelliko_fault_rename((folder + from).c_str(), (folder + to).c_str());
    }
    bool has(const std::string &name) const { return std::filesystem::exists(folder + name); }

    std::string folder;
};

TEST_F(Faults, WithoutAPlanEveryCallIsMade)
{
    EXPECT_EQ(rename("/a", "/b"), 0);
    EXPECT_TRUE(has("/b")) << "the arguments arrive";
}

TEST_F(Faults, TheNamedCallFailsOnceAndDoesNothing)
{
    ASSERT_EQ(planFaults("rename:2"), "");
    EXPECT_EQ(rename("/a", "/b"), 0);
    EXPECT_EQ(rename("/b", "/c"), -1);
    EXPECT_EQ(errno, EIO);
    EXPECT_TRUE(has("/b"));
    EXPECT_EQ(rename("/b", "/c"), 0);
    EXPECT_TRUE(has("/c"));
}

TEST_F(Faults, AResultCanBeChosen)
{
    ASSERT_EQ(planFaults("rename:1=-28,rename:2=3"), "");
    EXPECT_EQ(rename("/a", "/b"), -28);
    EXPECT_EQ(rename("/a", "/b"), 3);
    EXPECT_EQ(rename("/a", "/b"), 0);
}

TEST_F(Faults, ACallThatReturnsAPointerGivesNone)
{
    ASSERT_EQ(planFaults("calloc:1"), "");
    EXPECT_EQ(pelliko_fault_calloc(4, 8), nullptr);
    void *memory = pelliko_fault_calloc(4, 8);
    EXPECT_NE(memory, nullptr);
    free(memory);
}

TEST_F(Faults, ANewPlanCountsAnew)
{
    ASSERT_EQ(planFaults("rename:2"), "");
    EXPECT_EQ(rename("/a", "/b"), 0);
    ASSERT_EQ(planFaults("rename:1"), "");
    EXPECT_EQ(rename("/b", "/c"), -1);
}

TEST_F(Faults, APlanThatMakesNoSenseIsRefusedAndThePlanBeforeStays)
{
    ASSERT_EQ(planFaults("rename:1"), "");
    EXPECT_EQ(planFaults("renames:1"), "this program makes no call \"renames\"");
    for (const char *plan : {"rename", "rename:", "rename:0", "rename:x", "rename:1=", "rename:1=x",
                             "rename=1:1", "calloc:1,rename:-1"})
        EXPECT_NE(planFaults(plan), "") << plan;
    EXPECT_EQ(rename("/a", "/b"), -1);
}

TEST_F(Faults, TheTraceNamesEveryCallInOrder)
{
    ASSERT_EQ(planFaults("calloc:1"), "");
    ASSERT_EQ(traceCalls(folder + "/trace"), "");
    rename("/a", "/b");
    pelliko_fault_calloc(1, 1);
    rename("/b", "/c");
    ASSERT_EQ(traceCalls(""), "");
    rename("/c", "/d");
    std::stringstream text;
    text << std::ifstream(folder + "/trace").rdbuf();
    EXPECT_EQ(text.str(), "rename 1\ncalloc 1 failed\nrename 2\n");
    EXPECT_NE(traceCalls("/nowhere/trace"), "");
}

} // namespace
} // namespace pelliko::platform
