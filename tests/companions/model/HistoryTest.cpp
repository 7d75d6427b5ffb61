// What the history says of shares and understands of launch requests.
#include <history/Opening.h>
#include <history/Words.h>

#include <gtest/gtest.h>

namespace
{

using pelliko::companion::ReceivedShare;
using pelliko::companion::SentShare;
using pelliko::history::Kind;
using pelliko::history::Opening;
using pelliko::history::openingOf;
using pelliko::history::recipientsText;
using pelliko::history::rowOf;
using pelliko::history::senderText;
using pelliko::history::stateText;

constexpr const char *prefix = "http://tizen.org/appcontrol/operation/";

class Request
{
public:
    explicit Request(const std::string &operation)
    {
        app_control_create(&handle_);
        app_control_set_operation(handle_, (prefix + operation).c_str());
    }
    ~Request() { app_control_destroy(handle_); }
    Request(const Request &) = delete;
    Request &operator=(const Request &) = delete;

    Request &with(const char *key, const char *value)
    {
        app_control_add_extra_data(handle_, key, value);
        return *this;
    }
    Request &with(const char *key, std::vector<const char *> values)
    {
        app_control_add_extra_data_array(handle_, key, values.data(),
                                         static_cast<int>(values.size()));
        return *this;
    }
    Opening opened(Kind shown = Kind::sent) const { return openingOf(handle_, shown); }

private:
    app_control_h handle_ = nullptr;
};

SentShare sentTo(std::vector<std::string> names, pelliko_share_state_e state)
{
    SentShare share;
    share.state = state;
    share.size = 2'400'000;
    share.files.resize(2);
    for (std::string &name : names)
        share.recipients.push_back({"+1", std::move(name), PELLIKO_TOLD_SMS});
    return share;
}

TEST(HistoryOpening, TheNotificationOfSeveralSharesShowsTheReceivedOnes)
{
    const Opening opening =
        Request("view").with("view_type", "received").with("remoteShare", "remoteview").opened();
    EXPECT_EQ(Opening::What::show, opening.what);
    EXPECT_EQ(Kind::received, opening.kind);
}

TEST(HistoryOpening, ADefaultLaunchKeepsTheListThatIsShown)
{
    EXPECT_EQ(Kind::received, Request("default").opened(Kind::received).kind);
    EXPECT_EQ(Kind::sent, Request("default").opened(Kind::sent).kind);
}

TEST(HistoryOpening, AForwardedPushIsNewsOfItsTokens)
{
    const Opening opening =
        Request("send").with("contents_token_list", std::vector<const char *>{"a", "b"}).opened();
    EXPECT_EQ(Opening::What::news, opening.what);
    EXPECT_EQ((std::vector<std::string>{"a", "b"}), opening.tokens);
}

TEST(HistoryOpening, SharedAndResharedNameTheirRequest)
{
    EXPECT_EQ(17, Request("shared").with("request_id", "17").opened().request);
    EXPECT_EQ(18, Request("reshared").with("request_id", "18").opened().request);
}

TEST(HistoryOpening, ARequestIdThatIsNoneIsLeftOut)
{
    for (const char *bad : {"x", "-3", "0", "12x", "99999999999"})
        EXPECT_EQ(0, Request("shared").with("request_id", bad).opened().request) << bad;
    EXPECT_EQ(0, Request("shared").opened().request);
}

TEST(HistoryWords, ThreeRecipientsAreNamedAndTheOthersCounted)
{
    EXPECT_EQ("Ann, Bo, Cem",
              recipientsText(sentTo({"Ann", "Bo", "Cem"}, PELLIKO_SHARE_AVAILABLE)));
    EXPECT_EQ("Ann, Bo, Cem and 2 more",
              recipientsText(sentTo({"Ann", "Bo", "Cem", "Di", "Ed"}, PELLIKO_SHARE_AVAILABLE)));
    EXPECT_EQ("Nobody", recipientsText(sentTo({}, PELLIKO_SHARE_AVAILABLE)));
}

TEST(HistoryWords, ARowTellsWhoWhatAndHowItStands)
{
    const auto row = rowOf(sentTo({"Ann"}, PELLIKO_SHARE_WITHDRAWN), false);
    EXPECT_EQ("Ann", row.title);
    EXPECT_EQ("2 files, 2.4 MB", row.second);
    EXPECT_EQ("Withdrawn", row.third);
    EXPECT_EQ("New: \u2068Withdrawn\u2069",
              rowOf(sentTo({"Ann"}, PELLIKO_SHARE_WITHDRAWN), true).third);
}

TEST(HistoryWords, ServerAndDeviceErrorsAreToldApart)
{
    SentShare share = sentTo({"Ann"}, PELLIKO_SHARE_FAILED);
    for (int server : {-16, -7, -4}) {
        share.error = server;
        EXPECT_EQ("Failed: the server had an error", stateText(share)) << server;
    }
    for (int device : {-18, -5, 1}) {
        share.error = device;
        EXPECT_EQ("Failed: this device had an error", stateText(share)) << device;
    }
}

TEST(HistoryWords, ASenderWithoutANumberIsUnknown)
{
    EXPECT_EQ("Unknown sender", senderText(ReceivedShare{}));
}

} // namespace
