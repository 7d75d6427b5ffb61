// The real ModemManager with a simulated modem: what it reads and what becomes of messages.
#include <chrono>
#include <fstream>
#include <stdexcept>
#include <thread>

#include <JsonValue.h>
#include <gio/gio.h>
#include <gmock/gmock.h>

#include "ITapiNetwork.h"
#include "ITapiSim.h"
#include "ModemManagerService.h"
#include "Modems.h"
#include "msg.h"
#include "msg_transport.h"
#include "tapi_common.h"
#include "vconf-keys.h"
#include "vconf.h"

namespace
{

using namespace std::chrono_literals;
using pelliko::modem::currentModems;
using pelliko::modem::ModemManagerService;
using pelliko::modem::SimState;
using pelliko::test::JsonValue;
using testing::HasSubstr;

constexpr const char *script = PELLIKO_SOURCE_DIR "/tests/platform/modem/real_modemmanager.py";
constexpr const char *number = "+4915112345678";

// The service with everything around it; starting takes it some seconds, so all cases share it.
class RealModemManager : public testing::Test
{
protected:
    static void SetUpTestSuite()
    {
        outbox_ = testing::TempDir() + "real-modemmanager.jsonl";
        std::remove(outbox_.c_str());
        const auto flags = static_cast<GSubprocessFlags>(G_SUBPROCESS_FLAGS_STDIN_PIPE |
                                                         G_SUBPROCESS_FLAGS_STDOUT_PIPE);
        process_ = g_subprocess_new(flags, nullptr, "/usr/bin/python3", script, "262011234567890",
                                    outbox_.c_str(), nullptr);
        answers_ = g_data_input_stream_new(g_subprocess_get_stdout_pipe(process_));
        if (answer() != "ready")
            throw std::runtime_error("ModemManager did not start");
    }
    static void TearDownTestSuite()
    {
        g_output_stream_close(g_subprocess_get_stdin_pipe(process_), nullptr, nullptr);
        g_subprocess_wait(process_, nullptr, nullptr);
        g_object_unref(answers_);
        g_object_unref(process_);
    }
    void SetUp() override
    {
        tell("accept");
        tell("allow");
    }

    static std::string answer()
    {
        g_autofree gchar *line = g_data_input_stream_read_line(answers_, nullptr, nullptr, nullptr);
        return line ? line : "";
    }
    static void tell(const std::string &command)
    {
        const std::string line = command + "\n";
        g_output_stream_write_all(g_subprocess_get_stdin_pipe(process_), line.data(), line.size(),
                                  nullptr, nullptr, nullptr);
        ASSERT_EQ(answer(), "ok") << command;
    }
    // What the network has taken, oldest first.
    static std::vector<std::string> delivered()
    {
        std::vector<std::string> result;
        for (const auto &record : JsonValue::linesOf(outbox_))
            result.push_back(record["to"].text() + ": " + record["text"].text());
        return result;
    }
    static std::string send(const std::string &text)
    {
        return ModemManagerService().sendSms(0, number, text);
    }

private:
    static inline GSubprocess *process_ = nullptr;
    static inline GDataInputStream *answers_ = nullptr;
    static inline std::string outbox_;
};

// As the application sends: one recipient, the first SIM slot.
int platformSend(std::string text)
{
    std::string to = number;
    msg_handle_t handle = nullptr;
    msg_open_msg_handle(&handle);
    msg_struct_t message = msg_create_struct(MSG_STRUCT_MESSAGE_INFO), item = nullptr;
    msg_set_int_value(message, MSG_MESSAGE_SIM_INDEX_INT, 1);
    msg_set_str_value(message, MSG_MESSAGE_SMS_DATA_STR, text.data(),
                      static_cast<int>(text.size()));
    msg_list_add_item(message, MSG_MESSAGE_ADDR_LIST_STRUCT, &item);
    msg_set_str_value(item, MSG_ADDRESS_INFO_ADDRESS_VALUE_STR, to.data(),
                      static_cast<int>(to.size()));
    msg_struct_t request = msg_create_struct(MSG_STRUCT_REQUEST_INFO);
    msg_set_struct_handle(request, MSG_REQUEST_MESSAGE_HND, message);
    const int result = msg_sms_send_message(handle, request);
    msg_release_struct(&request);
    msg_release_struct(&message);
    msg_close_msg_handle(&handle);
    return result;
}

} // namespace

TEST_F(RealModemManager, TellsItsModemAndSim)
{
    const auto list = currentModems();
    ASSERT_EQ(list.modems.size(), 1U);
    EXPECT_EQ(list.modems[0].sim, SimState::Ready);
    EXPECT_EQ(list.modems[0].imsi, "262011234567890");
    EXPECT_EQ(list.modems[0].mncLength, 2);
    EXPECT_EQ(list.dataModem, 0);
}

TEST_F(RealModemManager, StandsBehindTelephony)
{
    char **names = tel_get_cp_name_list();
    ASSERT_NE(names, nullptr);
    TapiHandle *handle = tel_init(names[0]);
    TelSimImsiInfo_t imsi{};
    EXPECT_EQ(tel_get_sim_imsi(handle, &imsi), TAPI_API_SUCCESS);
    EXPECT_STREQ(imsi.szMcc, "262");
    EXPECT_STREQ(imsi.szMnc, "01");
    EXPECT_STREQ(imsi.szMsin, "1234567890");
    tel_deinit(handle);
    g_strfreev(names);
}

TEST_F(RealModemManager, SendsEveryKindOfText)
{
    std::string threeParts = "Three parts of the alphabet of phones: ";
    while (threeParts.size() < 400)
        threeParts += "0123456789 ";
    const std::vector<std::string> texts{"Hello", "Grüße für {2} Dateien: 5 €", "🎉 → 日本",
                                         threeParts};
    const size_t before = delivered().size();
    for (const auto &text : texts)
        EXPECT_EQ(send(text), "");
    const auto all = delivered();
    ASSERT_EQ(all.size(), before + texts.size());
    for (size_t i = 0; i < texts.size(); ++i)
        EXPECT_EQ(all[before + i], std::string(number) + ": " + texts[i]);
}

TEST_F(RealModemManager, PassesOnTheNetworksRefusal)
{
    const size_t before = delivered().size();
    tell("refuse");
    EXPECT_THAT(send("Hello"), HasSubstr("cannot send the message: "));
    EXPECT_EQ(delivered().size(), before);
    tell("accept");
    EXPECT_EQ(send("Hello again"), "");
    EXPECT_EQ(delivered().size(), before + 1);
}

TEST_F(RealModemManager, PassesOnThatTheUserMayNot)
{
    tell("deny");
    EXPECT_THAT(send("Hello"), HasSubstr("not authorized"));
}

TEST_F(RealModemManager, TakesThePlatformsMessages)
{
    const size_t before = delivered().size();
    EXPECT_EQ(platformSend("Grüße \xF0\x9F"), MSG_SUCCESS) << "cut inside a character";
    tell("refuse");
    EXPECT_NE(platformSend("never"), MSG_SUCCESS);
    const auto all = delivered();
    ASSERT_EQ(all.size(), before + 1);
    EXPECT_EQ(all.back(), std::string(number) + ": Grüße ");
}

TEST_F(RealModemManager, MakesTelephonyReady)
{
    int ready = -1;
    EXPECT_EQ(vconf_get_bool(VCONFKEY_TELEPHONY_READY, &ready), 0);
    EXPECT_EQ(ready, 1);
}

// Last, as there is no service any more afterwards.
TEST_F(RealModemManager, ThatIsKilledWhileSendingHasNotSent)
{
    tell("silent");
    std::string result = "not tried";
    std::thread sender([&] { result = send("never"); });
    tell("wait-message");
    tell("kill");
    sender.join();
    EXPECT_EQ(result, "cannot send the message: the modem service went away");
    EXPECT_TRUE(currentModems().modems.empty());
    int ready = -1;
    EXPECT_EQ(vconf_get_bool(VCONFKEY_TELEPHONY_READY, &ready), 0);
    EXPECT_EQ(ready, 0);
}
