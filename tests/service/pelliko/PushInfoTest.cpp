// Push information where the service has nothing to tell: every request is answered all the same.
#include "pelliko_client.h"
#include "pelliko_shares.h"

#include <gtest/gtest.h>

#include <future>
#include <string>
#include <thread>
#include <vector>

namespace
{
struct Seen {
    int result;
    std::string token;
    std::thread::id thread;
};

/** Asks for tokens as the application does: each from inside the answer to the one before. */
struct Chain {
    std::vector<std::string> tokens;
    std::vector<Seen> seen;
    std::promise<void> over;

    static void onInfo(int result, const char *token, pelliko_push_info_h info, void *data)
    {
        auto &chain = *static_cast<Chain *>(data);
        unsigned int count = 77;
        uint32_t size = 77;
        unsigned long long expires = 77;
        char *number = nullptr;
        EXPECT_EQ(pelliko_push_info_get_content_info_count(info, &count), result);
        EXPECT_EQ(pelliko_content_info_get_file_size(info, 0, &size), result);
        EXPECT_EQ(pelliko_push_info_get_expired_time(info, &expires), result);
        EXPECT_EQ(pelliko_push_info_get_sender_msisdn(info, &number), result);
        EXPECT_EQ(count + size + expires, 77U * 3) << "nothing is written";
        EXPECT_EQ(number, nullptr);
        chain.seen.push_back({result, token, std::this_thread::get_id()});
        if (chain.seen.size() < chain.tokens.size()) {
            EXPECT_EQ(
                pelliko_push_info_request(chain.tokens[chain.seen.size()].c_str(), onInfo, data),
                0);
        } else {
            chain.over.set_value();
        }
    }

    void run()
    {
        ASSERT_EQ(pelliko_push_info_request(tokens[0].c_str(), onInfo, this), 0);
        ASSERT_EQ(over.get_future().wait_for(std::chrono::seconds(30)), std::future_status::ready);
    }
};
} // namespace

TEST(PushInfo, tokensThatCannotBeAreAnsweredOneAfterTheOther)
{
    Chain chain;
    chain.tokens = {std::string(1000, 'x'), "", "no/path", "\xff\xfe", "0123456789abcdefghijklmn"};
    chain.run();
    ASSERT_EQ(chain.seen.size(), 5U);
    for (size_t i = 0; i < 4; ++i) {
        EXPECT_EQ(chain.seen[i].result, PELLIKO_SHARES_ERROR_NOT_FOUND) << i;
    }
    EXPECT_EQ(chain.seen[4].result, PELLIKO_SHARES_ERROR_REFUSED) << "there is no account";
    for (size_t i = 0; i < 5; ++i) {
        EXPECT_EQ(chain.seen[i].token, chain.tokens[i]);
        EXPECT_EQ(chain.seen[i].thread, chain.seen[0].thread);
        EXPECT_NE(chain.seen[i].thread, std::this_thread::get_id());
    }
}

TEST(PushInfo, onlyAMissingParameterIsRefusedAtOnce)
{
    EXPECT_LT(pelliko_push_info_request(nullptr, Chain::onInfo, nullptr), 0);
    EXPECT_LT(pelliko_push_info_request("token", nullptr, nullptr), 0);
    unsigned int count = 5;
    EXPECT_LT(pelliko_push_info_get_content_info_count(nullptr, &count), 0);
    EXPECT_EQ(count, 5U);
}
