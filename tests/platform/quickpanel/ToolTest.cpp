// The command-line tool as scripts use it.
#include <array>
#include <cstdio>

#include <sys/wait.h>

#include <JsonValue.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <app_control.h>

#include "support/Bus.h"

using namespace panel_testing;
using pelliko::test::JsonValue;

namespace
{

struct Outcome {
    int status;
    std::string output; // standard output and error
};

Outcome tool(const std::string &arguments)
{
    const std::string command = PELLIKO_BUILD_DIR "/bin/quickpanel-tool " + arguments + " 2>&1";
    FILE *pipe = popen(command.c_str(), "r");
    Outcome outcome{0, {}};
    std::array<char, 4096> buffer{};
    while (const size_t length = fread(buffer.data(), 1, buffer.size(), pipe))
        outcome.output.append(buffer.data(), length);
    outcome.status = WEXITSTATUS(pclose(pipe));
    return outcome;
}

class Tool : public testing::Test
{
protected:
    void SetUp() override { clearPanel(); }
    void TearDown() override { clearPanel(); }

    static void post(notification_type_e type, const char *title, const char *tag)
    {
        notification_h noti = make(type, title, tag);
        EXPECT_EQ(notification_post(noti), 0);
        notification_free(noti);
    }
};

TEST_F(Tool, ListsEveryField)
{
    notification_h noti = make(NOTIFICATION_TYPE_ONGOING, "unused", "7");
    notification_set_text(noti, NOTIFICATION_TEXT_TYPE_TITLE, "Sending 3 files", "IDS_SENDING",
                          NOTIFICATION_VARIABLE_TYPE_INT, 3, NOTIFICATION_VARIABLE_TYPE_NONE);
    notification_set_display_applist(noti, 9);
    notification_set_progress(noti, 0.5);
    notification_set_image(noti, NOTIFICATION_IMAGE_TYPE_ICON_FOR_INDICATOR, "/i.png");
    app_control_h request = nullptr;
    app_control_create(&request);
    app_control_set_app_id(request, "com.velmora.pelliko");
    app_control_add_extra_data(request, "total_files", "3");
    notification_set_launch_option(noti, NOTIFICATION_LAUNCH_OPTION_APP_CONTROL, request);
    app_control_destroy(request);
    EXPECT_EQ(notification_post(noti), 0);
    notification_free(noti);

    const Outcome outcome = tool("list --json");
    ASSERT_EQ(outcome.status, 0) << outcome.output;
    const JsonValue list = JsonValue::parse(outcome.output);
    ASSERT_EQ(list.size(), 1u);
    const JsonValue item = list[0];
    EXPECT_GT(item["id"].number(), 0);
    EXPECT_EQ(item["tag"], "7");
    EXPECT_EQ(item["type"], 1);
    EXPECT_EQ(item["layout"], 5);
    EXPECT_EQ(item["display"], 9);
    EXPECT_EQ(item["title"], "Sending 3 files");
    EXPECT_TRUE(item.contains("content"));
    EXPECT_EQ(item["content"], nullptr);
    EXPECT_EQ(item["texts"]["title"]["key"], "IDS_SENDING");
    EXPECT_EQ(item["texts"]["title"]["values"], JsonValue::parse("[3]"));
    EXPECT_EQ(item["progress"], 0.5);
    EXPECT_EQ(item["images"]["indicator"], "/i.png");
    EXPECT_EQ(item["launch"]["app_id"], "com.velmora.pelliko");
    EXPECT_EQ(item["launch"]["extras"]["total_files"], "3");
}

TEST_F(Tool, ListsOneApplicationOnly)
{
    post(NOTIFICATION_TYPE_NOTI, "mine", "7");
    EXPECT_EQ(tool("list --json --app com.example.nobody").output, "[]\n");
}

TEST_F(Tool, SwipesByTagAndById)
{
    post(NOTIFICATION_TYPE_NOTI, "by tag", "seven");
    EXPECT_EQ(tool("swipe seven").status, 0);
    EXPECT_TRUE(posted().empty());
    post(NOTIFICATION_TYPE_NOTI, "by id", nullptr);
    EXPECT_EQ(tool("swipe " + std::to_string(posted().at(0).id)).status, 0);
    EXPECT_TRUE(posted().empty());
}

TEST_F(Tool, TapsAndTellsInTheHistory)
{
    post(NOTIFICATION_TYPE_NOTI, "Files sent", "seven");
    EXPECT_EQ(tool("tap seven").status, 0);
    EXPECT_TRUE(posted().empty());
    EXPECT_EQ(history().back(), "tap Files sent");
}

TEST_F(Tool, RefusesInOneSentence)
{
    const Outcome unknown = tool("tap nobody");
    EXPECT_EQ(unknown.status, 1);
    EXPECT_EQ(unknown.output, "quickpanel-tool: nothing posted has the tag or private id nobody\n");
    post(NOTIFICATION_TYPE_ONGOING, "Sending", "seven");
    const Outcome ongoing = tool("swipe seven");
    EXPECT_EQ(ongoing.status, 1);
    EXPECT_EQ(ongoing.output, "quickpanel-tool: an ongoing notification cannot be swiped away\n");
    EXPECT_NE(tool("").status, 0);
    EXPECT_EQ(tool("--help").status, 0);
}

// The watcher starts while things happen and still tells each of them once, in order.
TEST_F(Tool, WatchTellsWhatWasAndWhatComes)
{
    const auto lastSeq = [] {
        const std::string all = tool("history --json").output;
        const size_t lastLine = all.rfind('\n', all.size() - 2);
        return JsonValue::parse(all.substr(lastLine == std::string::npos ? 0 : lastLine + 1))["seq"]
            .number();
    };
    post(NOTIFICATION_TYPE_NOTI, "marker", "marker");
    const int64_t since = lastSeq();
    post(NOTIFICATION_TYPE_NOTI, "before", "7");
    const std::string command =
        PELLIKO_BUILD_DIR "/bin/quickpanel-tool watch --count 3 --since " + std::to_string(since);
    FILE *watcher = popen(command.c_str(), "r");
    std::array<char, 8192> line{};
    ASSERT_NE(fgets(line.data(), line.size(), watcher), nullptr);
    EXPECT_EQ(JsonValue::parse(line.data())["title"], "before");
    post(NOTIFICATION_TYPE_NOTI, "after", "7");
    EXPECT_EQ(notification_status_message_post("done"), 0);
    ASSERT_NE(fgets(line.data(), line.size(), watcher), nullptr);
    const JsonValue second = JsonValue::parse(line.data());
    EXPECT_EQ(second["title"], "after");
    EXPECT_TRUE(second.contains("replaced"));
    ASSERT_NE(fgets(line.data(), line.size(), watcher), nullptr);
    EXPECT_EQ(JsonValue::parse(line.data())["message"], "done");
    EXPECT_EQ(WEXITSTATUS(pclose(watcher)), 0);
}

} // namespace
