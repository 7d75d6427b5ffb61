// What is said of a message whose sender was killed.
#include <cstdlib>
#include <filesystem>
#include <fstream>

#include <gtest/gtest.h>
#include <msg_fate.h>

#include "MessageBuilder.h"

namespace
{

class Fate : public testing::Test
{
protected:
    void SetUp() override
    {
        char pattern[] = "/tmp/fate-XXXXXX";
        folder_ = mkdtemp(pattern);
        path_ = folder_ / "sms.jsonl";
        setenv("PELLIKO_SMS_OUTBOX", path_.c_str(), 1);
        ASSERT_EQ(msg_open_msg_handle(&handle_), MSG_SUCCESS);
    }
    void TearDown() override
    {
        msg_close_msg_handle(&handle_);
        std::filesystem::remove_all(folder_);
    }

    std::filesystem::path folder_;
    std::filesystem::path path_;
    msg_handle_t handle_ = nullptr;
};

TEST_F(Fate, AMessageThatWasSentIsFoundAmongOthers)
{
    for (const char *to : {"+491", "+492", "+493"})
        ASSERT_EQ(sendOne(handle_, to, "a \"link\"\nand äöü", 2), MSG_SUCCESS);
    EXPECT_EQ(msg_sms_fate(handle_, "+492", "a \"link\"\nand äöü"), MSG_FATE_TAKEN);
}

TEST_F(Fate, AnotherTextOrNumberIsAnotherMessage)
{
    EXPECT_EQ(msg_sms_fate(handle_, "+491", "text"), MSG_FATE_NOT_TAKEN) << "nothing was ever sent";
    ASSERT_EQ(sendOne(handle_, "+491", "text", 1), MSG_SUCCESS);
    EXPECT_EQ(msg_sms_fate(handle_, "+491", "tex"), MSG_FATE_NOT_TAKEN);
    EXPECT_EQ(msg_sms_fate(handle_, "+491", "texts"), MSG_FATE_NOT_TAKEN);
    EXPECT_EQ(msg_sms_fate(handle_, "+49", "text"), MSG_FATE_NOT_TAKEN);
}

TEST_F(Fate, ATextCutInsideACharacterIsFound)
{
    ASSERT_EQ(sendOne(handle_, "+491", "ab\xc3", 1), MSG_SUCCESS);
    EXPECT_EQ(msg_sms_fate(handle_, "+491", "ab\xc3"), MSG_FATE_TAKEN);
}

TEST_F(Fate, HalfALineIsNoMessageButAWholeOneWithoutItsEndIs)
{
    const std::string line =
        R"({"to":"+491","text":"hello","sim":1,"time":"2026-01-01T00:00:00Z"})";
    std::ofstream(path_) << line.substr(0, line.size() - 1);
    EXPECT_EQ(msg_sms_fate(handle_, "+491", "hello"), MSG_FATE_NOT_TAKEN);
    std::ofstream(path_) << line;
    EXPECT_EQ(msg_sms_fate(handle_, "+491", "hello"), MSG_FATE_TAKEN);
}

TEST_F(Fate, WithoutAReadableOutboxNobodyKnows)
{
    std::filesystem::create_directory(path_);
    EXPECT_EQ(msg_sms_fate(handle_, "+491", "text"), MSG_FATE_UNKNOWN);
    EXPECT_EQ(msg_sms_fate(nullptr, "+491", "text"), MSG_FATE_UNKNOWN);
}

} // namespace
