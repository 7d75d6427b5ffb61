// Toasts, and calls from a process that ends at once or has no bus.
#include <cstdlib>

#include <sys/wait.h>
#include <unistd.h>

#include <gtest/gtest.h>

#include "support/Bus.h"

using namespace panel_testing;

namespace
{

// Runs one disabled case of this program in a process of its own and gives its exit status.
int runAlone(const char *name)
{
    const std::string filter = std::string("--gtest_filter=") + name;
    const pid_t child = fork();
    if (child == 0) {
        execl("/proc/self/exe", "notification_test", filter.c_str(),
              "--gtest_also_run_disabled_tests", "--gtest_brief=1", nullptr);
        _exit(127);
    }
    int status = 0;
    waitpid(child, &status, 0);
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

TEST(Alone, DISABLED_PostsAToastAndEnds)
{
    _exit(notification_status_message_post("Too many files") == 0 ? 0 : 1);
}

TEST(Alone, DISABLED_HasNoBus)
{
    notification_h noti = make(NOTIFICATION_TYPE_NOTI, "nowhere", "7");
    EXPECT_EQ(notification_post(noti), NOTIFICATION_ERROR_SERVICE_NOT_READY);
    EXPECT_EQ(notification_update(noti), NOTIFICATION_ERROR_NOT_EXIST_ID);
    EXPECT_EQ(notification_delete_all(NOTIFICATION_TYPE_NONE),
              NOTIFICATION_ERROR_SERVICE_NOT_READY);
    EXPECT_EQ(notification_load_by_tag("7"), nullptr);
    EXPECT_EQ(get_last_result(), NOTIFICATION_ERROR_SERVICE_NOT_READY);
    EXPECT_EQ(notification_status_message_post("x"), NOTIFICATION_ERROR_SERVICE_NOT_READY);
    EXPECT_EQ(titleOf(noti), "nowhere");
    notification_free(noti);
}

TEST(Toast, SurvivesTheProcessThatPostedIt)
{
    const size_t before = history().size();
    ASSERT_EQ(runAlone("Alone.DISABLED_PostsAToastAndEnds"), 0);
    const auto after = history();
    ASSERT_EQ(after.size(), before + 1);
    EXPECT_EQ(after.back(), "toast Too many files");
}

TEST(Toast, IsNotPosted)
{
    clearPanel();
    EXPECT_EQ(notification_status_message_post("short"), NOTIFICATION_ERROR_NONE);
    EXPECT_TRUE(posted().empty());
}

TEST(Unreachable, PostingFailsAndLeavesTheHandleUsable)
{
    const std::string address = getenv("DBUS_SESSION_BUS_ADDRESS");
    setenv("DBUS_SESSION_BUS_ADDRESS", "unix:path=/nonexistent/bus", 1);
    const int result = runAlone("Alone.DISABLED_HasNoBus");
    setenv("DBUS_SESSION_BUS_ADDRESS", address.c_str(), 1);
    EXPECT_EQ(result, 0);
}

} // namespace
