#include "Scene.h"

#include <velmora_log_manager.h>

#include <ctime>
#include <regex>
#include <thread>

#include <JsonValue.h>
#include <glib.h>
#include <gmock/gmock.h>

namespace pelliko::velmora::test
{
namespace
{
using pelliko::test::JsonValue;

constexpr const char *uri = "content://com.velmora.log.provider/log/use_app_feature_survey";

struct Completed {
    int request;
    std::string uri;
    int error;
    std::thread::id thread;
};

void onInserted(int request, const char *completedUri, int error, void *data)
{
    static_cast<std::vector<Completed> *>(data)->push_back(
        {request, completedUri, error, std::this_thread::get_id()});
}

using Texts = std::vector<std::pair<const char *, const char *>>;

class UsageClient : public testing::Test
{
protected:
    UsageClient()
    {
        std::filesystem::remove_all(users.place().folder);
        EXPECT_EQ(users.setCollecting(true), 0);
        EXPECT_EQ(velmora_log_manager_create(&handle), 0);
    }
    ~UsageClient() override
    {
        velmora_log_manager_destroy(handle);
        waitForNothing();
    }

    int insert(const Texts &texts, const char *to = uri)
    {
        bundle *data = bundle_create();
        for (const auto &[key, text] : texts) {
            bundle_add_str(data, key, text);
        }
        const int result =
            velmora_log_manager_insert(handle, to, data, onInserted, &completed, &request);
        bundle_free(data);
        return result;
    }

    void waitForCompletions(size_t count)
    {
        while (completed.size() < count) {
            g_main_context_iteration(nullptr, TRUE);
        }
    }

    // Serves what is on the loop already.
    static void waitForNothing()
    {
        while (g_main_context_iteration(nullptr, FALSE)) {
        }
    }

    std::vector<JsonValue> records() const
    {
        std::vector<std::string> lines;
        EXPECT_EQ(users.read(lines), 0);
        std::vector<JsonValue> all;
        for (const std::string &line : lines) {
            all.push_back(JsonValue::parse(line));
        }
        return all;
    }

    const RecordLog users{RecordLogPlace::ofUser()};
    velmora_log_manager_h handle = nullptr;
    std::vector<Completed> completed;
    int request = -7;
};

TEST_F(UsageClient, ARecordCarriesItsKeysAndTheTime)
{
    const std::time_t before = std::time(nullptr);
    ASSERT_EQ(insert({{"app_id", "com.velmora.pelliko"}, {"feature", "PK05"}, {"extra", "1_10"}}),
              0);
    const auto all = records();
    ASSERT_EQ(all.size(), 1U);
    EXPECT_EQ(all[0].size(), 5U);
    EXPECT_EQ(all[0]["app_id"], "com.velmora.pelliko");
    EXPECT_EQ(all[0]["feature"], "PK05");
    EXPECT_EQ(all[0]["extra"], "1_10");
    EXPECT_EQ(all[0]["uri"], "/log/use_app_feature_survey");
    std::tm parts{};
    ASSERT_NE(strptime(all[0]["time"].text().c_str(), "%Y-%m-%dT%H:%M:%SZ", &parts), nullptr);
    EXPECT_GE(timegm(&parts), before);
    EXPECT_LE(timegm(&parts), std::time(nullptr));
}

TEST_F(UsageClient, CompletionsComeFromTheLoopInOrder)
{
    ASSERT_EQ(insert({{"feature", "PK01"}}), 0);
    const int first = request;
    ASSERT_EQ(insert({{"feature", "PK02"}}), 0);
    EXPECT_EQ(request, first + 1);
    EXPECT_GT(first, 0);
    EXPECT_TRUE(completed.empty());
    waitForCompletions(2);
    EXPECT_EQ(completed[0].request, first);
    EXPECT_EQ(completed[1].request, first + 1);
    EXPECT_EQ(completed[0].uri, uri);
    EXPECT_EQ(completed[0].error, 0);
}

TEST_F(UsageClient, ACompletionForAnotherThreadComesFromTheLoopToo)
{
    std::thread([this] { EXPECT_EQ(insert({{"feature", "PK09"}}), 0); }).join();
    waitForCompletions(1);
    EXPECT_EQ(completed[0].thread, std::this_thread::get_id());
}

TEST_F(UsageClient, ManyThreadsMayInsertAtOnce)
{
    constexpr int each = 50;
    std::vector<std::thread> threads;
    std::atomic<int> done{0};
    for (int i = 0; i < 4; ++i) {
        threads.emplace_back([this, &done] {
            bundle *data = bundle_create();
            bundle_add_str(data, "feature", "PK09");
            int id = 0;
            for (int n = 0; n < each; ++n) {
                done += velmora_log_manager_insert(handle, uri, data, nullptr, nullptr, &id) == 0;
            }
            bundle_free(data);
        });
    }
    for (std::thread &thread : threads) {
        thread.join();
    }
    EXPECT_EQ(done, 4 * each);
    EXPECT_EQ(records().size(), 4U * each);
}

TEST_F(UsageClient, CompletionsEndWithTheHandle)
{
    ASSERT_EQ(insert({{"feature", "PK01"}}), 0);
    ASSERT_EQ(velmora_log_manager_destroy(handle), 0);
    waitForNothing();
    EXPECT_TRUE(completed.empty());
    EXPECT_EQ(records().size(), 1U);
}

TEST_F(UsageClient, AHandleThatIsNoneIsRefused)
{
    velmora_log_manager_h good = handle;
    handle = nullptr;
    EXPECT_EQ(insert({{"feature", "PK01"}}), TIZEN_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(velmora_log_manager_destroy(nullptr), TIZEN_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(velmora_log_manager_create(nullptr), TIZEN_ERROR_INVALID_PARAMETER);
    ASSERT_EQ(velmora_log_manager_destroy(good), 0);
    handle = good;
    EXPECT_EQ(insert({{"feature", "PK01"}}), TIZEN_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(velmora_log_manager_destroy(good), TIZEN_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(request, -7);
    EXPECT_TRUE(records().empty());
}

TEST_F(UsageClient, WhatIsNoRecordIsRefused)
{
    EXPECT_EQ(insert({}), TIZEN_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(insert({{"feature", "PK01"}, {"number", "+44"}}), TIZEN_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(insert({{"feature", "PK01"}}, "/log"), TIZEN_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(insert({{"feature", "PK01"}}, "content://host"), TIZEN_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(insert({{"feature", "PK01"}}, nullptr), TIZEN_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(velmora_log_manager_insert(handle, uri, nullptr, onInserted, &completed, &request),
              TIZEN_ERROR_INVALID_PARAMETER);
    bundle *data = bundle_create();
    bundle_add_str(data, "feature", "PK01");
    EXPECT_EQ(velmora_log_manager_insert(handle, uri, data, onInserted, &completed, nullptr),
              TIZEN_ERROR_INVALID_PARAMETER);
    bundle_free(data);
    waitForNothing();
    EXPECT_TRUE(completed.empty());
    EXPECT_TRUE(records().empty());
}

TEST_F(UsageClient, TextThatIsNoUtf8MakesAReadableRecord)
{
    ASSERT_EQ(insert({{"feature", "a\"b\n\xff"}}), 0);
    EXPECT_EQ(records().at(0)["feature"], "a\"b\n\xef\xbf\xbd");
}

TEST_F(UsageClient, WhileOffRecordsAreRefusedByTheCompletion)
{
    ASSERT_EQ(users.setCollecting(false), 0);
    ASSERT_EQ(insert({{"feature", "PK01"}}), 0);
    waitForCompletions(1);
    EXPECT_EQ(completed[0].error, TIZEN_ERROR_NOT_PERMITTED);
    ASSERT_EQ(users.setCollecting(true), 0);
    EXPECT_TRUE(records().empty());
}

TEST_F(UsageClient, AFileThatCannotBeWrittenIsToldToTheCompletionAlone)
{
    std::filesystem::remove_all(users.place().folder);
    std::ofstream(users.place().folder) << "in the way";
    EXPECT_EQ(insert({{"feature", "PK01"}}), 0);
    waitForCompletions(1);
    EXPECT_EQ(completed[0].error, -ENOTDIR);
    std::filesystem::remove(users.place().folder);
    EXPECT_EQ(insert({{"feature", "PK02"}}), 0);
    waitForCompletions(2);
    EXPECT_EQ(completed[1].error, 0);
}

TEST_F(UsageClient, AFolderThatCannotBeMadeLeavesTheHandleAsItWas)
{
    std::filesystem::remove_all(users.place().folder);
    std::ofstream(users.place().folder) << "in the way";
    velmora_log_manager_h second = nullptr;
    EXPECT_NE(velmora_log_manager_create(&second), 0);
    EXPECT_EQ(second, nullptr);
    std::filesystem::remove(users.place().folder);
    EXPECT_EQ(velmora_log_manager_create(&second), 0);
    EXPECT_NE(second, nullptr);
    EXPECT_EQ(velmora_log_manager_destroy(second), 0);
}

TEST_F(UsageClient, ARecordSurvivesAProcessThatDiesRightAfterIt)
{
    const pid_t child = startChild([this] {
        EXPECT_EQ(insert({{"feature", "PK09"}}), 0);
        raise(SIGKILL);
    });
    int status = 0;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    EXPECT_TRUE(WIFSIGNALED(status));
    ASSERT_EQ(records().size(), 1U);
}
} // namespace
} // namespace pelliko::velmora::test
