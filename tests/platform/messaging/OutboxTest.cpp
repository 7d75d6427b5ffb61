#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <regex>
#include <thread>

#include <sys/resource.h>

#include <JsonValue.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "MessageBuilder.h"

namespace
{

using pelliko::test::JsonValue;
using testing::ElementsAre;

class Outbox : public testing::Test
{
protected:
    void SetUp() override
    {
        char pattern[] = "/tmp/outbox-XXXXXX";
        folder_ = mkdtemp(pattern);
        use(folder_ / "sms.jsonl");
    }
    void TearDown() override
    {
        if (handle_)
            msg_close_msg_handle(&handle_);
        std::filesystem::remove_all(folder_);
    }

    void use(const std::filesystem::path &path)
    {
        if (handle_)
            msg_close_msg_handle(&handle_);
        path_ = path;
        setenv("PELLIKO_SMS_OUTBOX", path.c_str(), 1);
        ASSERT_EQ(msg_open_msg_handle(&handle_), MSG_SUCCESS);
    }

    std::vector<JsonValue> messages() const { return JsonValue::linesOf(path_); }

    std::vector<std::string> recipients() const
    {
        std::vector<std::string> result;
        for (const auto &message : messages())
            result.push_back(message["to"].text());
        return result;
    }

    std::filesystem::path folder_;
    std::filesystem::path path_;
    msg_handle_t handle_ = nullptr;
};

TEST_F(Outbox, OneMessageIsOneLine)
{
    ASSERT_EQ(sendOne(handle_, "+4915112345", "Hallo \"Welt\"\nzweite Zeile äöü", 2), MSG_SUCCESS);
    const auto sent = messages();
    ASSERT_EQ(sent.size(), 1u);
    EXPECT_EQ(sent[0].size(), 4u);
    EXPECT_EQ(sent[0]["to"], "+4915112345");
    EXPECT_EQ(sent[0]["text"], "Hallo \"Welt\"\nzweite Zeile äöü");
    EXPECT_EQ(sent[0]["sim"], 2);
    EXPECT_TRUE(
        std::regex_match(sent[0]["time"].text(), std::regex(R"(\d{4}-\d\d-\d\dT\d\d:\d\d:\d\dZ)")));
}

TEST_F(Outbox, ThreeRecipientsGiveThreeMessagesInOrder)
{
    for (const char *to : {"+491", "+492", "+493"})
        EXPECT_EQ(sendOne(handle_, to, "same", 1), MSG_SUCCESS);
    EXPECT_THAT(recipients(), ElementsAre("+491", "+492", "+493"));
}

TEST_F(Outbox, EveryAddressOfAMessageIsReached)
{
    msg_struct_t message = makeMessage("+491", "both", 1);
    msg_struct_t item = nullptr;
    msg_list_add_item(message, MSG_MESSAGE_ADDR_LIST_STRUCT, &item);
    setText(item, MSG_ADDRESS_INFO_ADDRESS_VALUE_STR, "+492");
    msg_struct_t request = makeRequest(message);
    EXPECT_EQ(msg_sms_send_message(handle_, request), MSG_SUCCESS);
    msg_release_struct(&request);
    msg_release_struct(&message);
    EXPECT_THAT(recipients(), ElementsAre("+491", "+492"));
}

TEST_F(Outbox, AnEmptyTextIsSent)
{
    EXPECT_EQ(sendOne(handle_, "+491", "", 1), MSG_SUCCESS);
    EXPECT_EQ(messages().at(0)["text"], "");
}

TEST_F(Outbox, OnlyTheGivenLengthIsSent)
{
    msg_struct_t message = makeMessage("+491", "", 1);
    char text[] = "abcdef";
    msg_set_str_value(message, MSG_MESSAGE_SMS_DATA_STR, text, 3);
    msg_struct_t request = makeRequest(message);
    EXPECT_EQ(msg_sms_send_message(handle_, request), MSG_SUCCESS);
    msg_release_struct(&request);
    msg_release_struct(&message);
    EXPECT_EQ(messages().at(0)["text"], "abc");
}

TEST_F(Outbox, ATextCutInsideACharacterStaysReadable)
{
    EXPECT_EQ(sendOne(handle_, "+491", "ab\xc3", 1), MSG_SUCCESS);
    EXPECT_EQ(messages().at(0)["text"], "ab\xef\xbf\xbd");
}

TEST_F(Outbox, TheMessageIsCopiedIntoTheRequest)
{
    msg_struct_t message = makeMessage("+491", "before", 1);
    msg_struct_t request = makeRequest(message);
    setText(message, MSG_MESSAGE_SMS_DATA_STR, "after");
    msg_release_struct(&message);
    EXPECT_EQ(msg_sms_send_message(handle_, request), MSG_SUCCESS);
    msg_release_struct(&request);
    EXPECT_EQ(messages().at(0)["text"], "before");
}

TEST_F(Outbox, IncompleteRequestsAreRefused)
{
    msg_struct_t request = msg_create_struct(MSG_STRUCT_REQUEST_INFO);
    EXPECT_NE(msg_sms_send_message(handle_, request), MSG_SUCCESS);
    msg_struct_t message = msg_create_struct(MSG_STRUCT_MESSAGE_INFO);
    setText(message, MSG_MESSAGE_SMS_DATA_STR, "no address");
    msg_set_struct_handle(request, MSG_REQUEST_MESSAGE_HND, message);
    EXPECT_NE(msg_sms_send_message(handle_, request), MSG_SUCCESS);
    EXPECT_NE(msg_sms_send_message(handle_, message), MSG_SUCCESS);
    msg_release_struct(&request);
    msg_release_struct(&message);
    EXPECT_NE(sendOne(handle_, "", "no number", 1), MSG_SUCCESS);
    EXPECT_FALSE(std::filesystem::exists(path_));
}

TEST_F(Outbox, AFullDiskIsAnError)
{
    use("/dev/full");
    EXPECT_NE(sendOne(handle_, "+491", "lost", 1), MSG_SUCCESS);
}

TEST_F(Outbox, AMissingFolderIsAnError)
{
    use(folder_ / "missing" / "sms.jsonl");
    EXPECT_NE(sendOne(handle_, "+491", "lost", 1), MSG_SUCCESS);
}

// A file-size limit lets the first bytes of the line through, as a disk does that fills up.
TEST_F(Outbox, HalfALineIsTakenBack)
{
    ASSERT_EQ(sendOne(handle_, "+491", "kept", 1), MSG_SUCCESS);
    const auto size = std::filesystem::file_size(path_);
    rlimit before{};
    getrlimit(RLIMIT_FSIZE, &before);
    const auto handler = std::signal(SIGXFSZ, SIG_IGN);
    const rlimit tight{size + 10, before.rlim_max};
    setrlimit(RLIMIT_FSIZE, &tight);
    const int result = sendOne(handle_, "+492", "lost", 1);
    setrlimit(RLIMIT_FSIZE, &before);
    std::signal(SIGXFSZ, handler);
    EXPECT_NE(result, MSG_SUCCESS);
    EXPECT_EQ(std::filesystem::file_size(path_), size);
    EXPECT_EQ(sendOne(handle_, "+493", "again", 1), MSG_SUCCESS);
    EXPECT_THAT(recipients(), ElementsAre("+491", "+493"));
}

TEST_F(Outbox, ALineBrokenByAKilledWriterDoesNotSpoilTheNext)
{
    std::ofstream(path_) << R"({"to":"+49)";
    ASSERT_EQ(sendOne(handle_, "+491", "whole", 1), MSG_SUCCESS);
    std::ifstream file(path_);
    std::string line;
    std::getline(file, line);
    std::getline(file, line);
    EXPECT_EQ(JsonValue::parse(line)["to"], "+491");
}

TEST_F(Outbox, ThreadsSendAtTheSameTimeWithoutMixingLines)
{
    constexpr int threadCount = 4;
    constexpr int perThread = 25;
    std::vector<std::thread> threads;
    for (int thread = 0; thread < threadCount; ++thread) {
        threads.emplace_back([] {
            msg_handle_t own = nullptr;
            msg_open_msg_handle(&own);
            for (int i = 0; i < perThread; ++i)
                EXPECT_EQ(sendOne(own, "+491", std::string(200, 'x'), 1), MSG_SUCCESS);
            msg_close_msg_handle(&own);
        });
    }
    for (auto &thread : threads)
        thread.join();
    EXPECT_EQ(messages().size(), static_cast<size_t>(threadCount * perThread));
}

TEST_F(Outbox, LivesInTheStateDirectoryUnlessNamed)
{
    unsetenv("PELLIKO_SMS_OUTBOX");
    setenv("XDG_DATA_HOME", folder_.c_str(), 1);
    msg_handle_t handle = nullptr;
    ASSERT_EQ(msg_open_msg_handle(&handle), MSG_SUCCESS);
    EXPECT_EQ(sendOne(handle, "+491", "here", 1), MSG_SUCCESS);
    msg_close_msg_handle(&handle);
    path_ = folder_ / "pelliko-platform" / "sms-outbox.jsonl";
    EXPECT_THAT(recipients(), ElementsAre("+491"));
    unsetenv("XDG_DATA_HOME");
}

} // namespace
