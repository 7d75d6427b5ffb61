#include "PellikoApp/Workers.h"

#include <atomic>
#include <future>
#include <gtest/gtest.h>
#include <thread>

namespace pelliko
{
namespace
{

using namespace std::chrono_literals;

TEST(Workers, WorkRunsOnAnotherThreadAndIsWaitedFor)
{
    std::promise<std::thread::id> ran;
    EXPECT_TRUE(startDetachedWorker([&ran] { ran.set_value(std::this_thread::get_id()); }));
    EXPECT_NE(ran.get_future().get(), std::this_thread::get_id());
    EXPECT_TRUE(waitForWorkers(10s));
}

TEST(Workers, WaitingIsBounded)
{
    std::promise<void> go;
    std::shared_future<void> gone = go.get_future().share();
    std::atomic<bool> done = false;
    ASSERT_TRUE(startDetachedWorker([gone, &done] {
        gone.wait();
        done = true;
    }));
    EXPECT_FALSE(waitForWorkers(1ms));
    EXPECT_FALSE(done);
    go.set_value();
    EXPECT_TRUE(waitForWorkers(10s));
    EXPECT_TRUE(done);
}

TEST(Workers, WithoutWorkersThereIsNothingToWaitFor)
{
    EXPECT_TRUE(waitForWorkers(0ms));
}

} // namespace
} // namespace pelliko
