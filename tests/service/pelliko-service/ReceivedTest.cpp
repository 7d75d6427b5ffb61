// What others share arrives, over every restart on its way. The user shares with the own number.
#include "FaultPlan.h"
#include "World.h"
#include "pelliko_shares.h"

#include <JsonValue.h>
#include <gmock/gmock.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <mutex>
#include <set>

using pelliko::test::JsonValue;
using testing::Each;
using testing::ElementsAre;
using testing::IsEmpty;

namespace
{
constexpr const char *operationSend = "http://tizen.org/appcontrol/operation/send";
constexpr const char *self = "+447700900100";

std::string contentOf(const std::string &path)
{
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), {}};
}

struct Info {
    int result = 1;
    unsigned int count = 0;
    std::vector<uint32_t> sizes;
    unsigned long long expires = 0;
    std::string sender;
    bool done = false;
};

struct Saved {
    int result = 1;
    std::vector<std::string> paths;
    int64_t done = 0;
    int64_t total = 0;
    bool over = false;
};

struct Sent {
    int result = 1;
    int state = -1;
    std::vector<int> told;
    int files = 0;
};

class Received : public World
{
protected:
    void start()
    {
        startServer();
        makeAccount();
        startService();
    }

    int32_t share(const std::vector<std::string> &files)
    {
        int32_t id = 0;
        EXPECT_EQ(requestTo({{"44", self}}, files, &id), 0);
        EXPECT_TRUE(waitForEnd(id));
        return id;
    }

    /** Every token that the application was told, in order. */
    static std::vector<std::string> tokens(const RecordingApplication &application)
    {
        std::vector<std::string> result;
        for (const SeenLaunch &launch : application.launches) {
            if (launch.operation == operationSend) {
                const auto &list = launch.lists.at("contents_token_list");
                result.insert(result.end(), list.begin(), list.end());
            }
        }
        return result;
    }

    static bool waitForTokens(const RecordingApplication &application, size_t count)
    {
        return runUntil([&] { return tokens(application).size() >= count; });
    }

    static Info infoOf(const std::string &token)
    {
        Info info;
        std::mutex mutex;
        struct Both {
            Info &info;
            std::mutex &mutex;
        } both{info, mutex};
        pelliko_push_info_request(
            token.c_str(),
            [](int result, const char *, pelliko_push_info_h handle, void *data) {
                auto &seen = *static_cast<Both *>(data);
                const std::lock_guard lock(seen.mutex);
                seen.info.result = result;
                pelliko_push_info_get_content_info_count(handle, &seen.info.count);
                for (unsigned int i = 0; i < seen.info.count; ++i) {
                    uint32_t size = 0;
                    EXPECT_EQ(pelliko_content_info_get_file_size(handle, i, &size), 0);
                    seen.info.sizes.push_back(size);
                }
                pelliko_push_info_get_expired_time(handle, &seen.info.expires);
                char *number = nullptr;
                if (pelliko_push_info_get_sender_msisdn(handle, &number) == 0) {
                    seen.info.sender = number;
                    free(number);
                }
                seen.info.done = true;
                g_main_context_wakeup(nullptr);
            },
            &both);
        EXPECT_TRUE(runUntil([&] {
            const std::lock_guard lock(mutex);
            return info.done;
        }));
        const std::lock_guard lock(mutex);
        return info;
    }

    static void onSaved(int result, const char *const *paths, int count, void *data)
    {
        auto &saved = *static_cast<Saved *>(data);
        saved.result = result;
        for (int i = 0; i < count; ++i) {
            saved.paths.emplace_back(paths[i]);
        }
        saved.over = true;
    }

    static void onBytes(int, int64_t done, int64_t total, void *data)
    {
        auto &saved = *static_cast<Saved *>(data);
        saved.done = done;
        saved.total = total;
    }

    Saved save(const std::string &token, int file = PELLIKO_SHARES_ALL_FILES)
    {
        Saved saved;
        EXPECT_EQ(pelliko_shares_download(token.c_str(), file, downloads().c_str(), onBytes,
                                          onSaved, &saved, nullptr),
                  0);
        EXPECT_TRUE(runUntil([&] { return saved.over; }, 60));
        return saved;
    }

    std::string downloads() const { return folder_ + "/downloads"; }

    static std::vector<std::pair<std::string, int>> receivedList()
    {
        struct List {
            std::vector<std::pair<std::string, int>> shares;
            bool over = false;
        } list;
        pelliko_shares_list_received(
            [](int result, const pelliko_received_share_s *shares, int count, void *data) {
                EXPECT_EQ(result, 0);
                auto &found = *static_cast<List *>(data);
                for (int i = 0; i < count; ++i) {
                    found.shares.emplace_back(shares[i].contents_token, shares[i].state);
                }
                found.over = true;
            },
            &list, nullptr);
        EXPECT_TRUE(runUntil([&] { return list.over; }));
        return list.shares;
    }

    static std::vector<Sent> sentList()
    {
        struct List {
            std::vector<Sent> shares;
            bool over = false;
        } list;
        pelliko_shares_list_sent(
            [](int result, const pelliko_sent_share_s *shares, int count, void *data) {
                EXPECT_EQ(result, 0);
                auto &found = *static_cast<List *>(data);
                for (int i = 0; i < count; ++i) {
                    Sent sent{result, shares[i].state, {}, shares[i].file_count};
                    for (int j = 0; j < shares[i].recipient_count; ++j) {
                        sent.told.push_back(shares[i].recipients[j].told);
                    }
                    found.shares.push_back(sent);
                }
                found.over = true;
            },
            &list, nullptr);
        EXPECT_TRUE(runUntil([&] { return list.over; }));
        return list.shares;
    }

    static int resultOf(const std::function<int(pelliko_shares_done_cb, void *)> &call)
    {
        int result = 1;
        EXPECT_EQ(call([](int got, void *data) { *static_cast<int *>(data) = got; }, &result), 0);
        EXPECT_TRUE(runUntil([&] { return result != 1; }));
        return result;
    }
};
} // namespace

TEST_F(Received, aShareArrivesWithEverythingThatTheApplicationAsksFor)
{
    start();
    const RecordingApplication application;
    const std::string one = makeFile("one.jpg", 70'000);
    const std::string empty = makeFile("empty.txt", 0);
    int32_t id = 0;
    ASSERT_EQ(requestTo({{"44", self}, {"44", "+447700900222"}, {"", "12"}}, {one, empty}, &id), 0);
    ASSERT_TRUE(waitForEnd(id));
    ASSERT_TRUE(waitForTokens(application, 1));
    const std::string token = tokens(application)[0];
    EXPECT_LE(token.size(), 24U);
    const Info info = infoOf(token);
    EXPECT_EQ(info.result, 0);
    EXPECT_THAT(info.sizes, ElementsAre(70'000U, 0U));
    EXPECT_EQ(static_cast<int64_t>(info.expires), reportsOf(id).back().expired);
    EXPECT_EQ(info.sender, self);
    EXPECT_THAT(receivedList(), ElementsAre(std::pair(token, int(PELLIKO_SHARE_AVAILABLE))));
    const auto sent = sentList();
    ASSERT_EQ(sent.size(), 1U);
    EXPECT_EQ(sent[0].state, PELLIKO_SHARE_AVAILABLE);
    EXPECT_THAT(sent[0].told,
                ElementsAre(PELLIKO_TOLD_PUSH, PELLIKO_TOLD_SMS, PELLIKO_TOLD_NOBODY));

    const Saved saved = save(token);
    EXPECT_EQ(saved.result, 0);
    ASSERT_THAT(saved.paths, ElementsAre(downloads() + "/one.jpg", downloads() + "/empty.txt"));
    EXPECT_TRUE(contentOf(saved.paths[0]) == contentOf(one));
    EXPECT_EQ(saved.done, 70'000);
    EXPECT_EQ(saved.total, 70'000);
    EXPECT_THAT(save(token, 0).paths, ElementsAre(downloads() + "/one (2).jpg"));
    EXPECT_EQ(save(token, 2).result, PELLIKO_SHARES_ERROR_INVALID_PARAMETER);
}

TEST_F(Received, aPushWaitsForServiceAndApplicationAndIsShownOnce)
{
    start();
    auto application = std::make_unique<RecordingApplication>();
    application->confirms = false;
    int32_t id = 0;
    ASSERT_EQ(requestTo({{"44", self}}, {makeFile("a.jpg", 100)}, &id), 0);
    ASSERT_TRUE(waitForTokens(*application, 1));
    const std::string token = tokens(*application)[0];
    service_->end(SIGKILL); // between launch and receipt
    application.reset();
    startService(); // now there is no application to launch
    RecordingApplication second;
    ASSERT_TRUE(waitForTokens(second, 1));
    EXPECT_THAT(tokens(second), ElementsAre(token));
    share({makeFile("b.jpg", 100)}); // launched for when the receipt of the first is on disk
    ASSERT_TRUE(waitForTokens(second, 2));
    service_->end(SIGKILL);
    startService();
    share({makeFile("c.jpg", 100)});
    ASSERT_TRUE(runUntil([&] { return receivedList().size() == 3; }));
    ASSERT_TRUE(runUntil([&] {
        const auto all = tokens(second);
        return std::set<std::string>(all.begin(), all.end()).size() == 3;
    }));
    const auto seen = tokens(second);
    EXPECT_EQ(std::count(seen.begin(), seen.end(), token), 1);
}

TEST_F(Received, theStreamComesBackAfterTheServer)
{
    start();
    const RecordingApplication application;
    share({makeFile("a.jpg", 100)});
    ASSERT_TRUE(waitForTokens(application, 1));
    server_->end(SIGKILL);
    startServer();
    share({makeFile("b.jpg", 100)});
    ASSERT_TRUE(waitForTokens(application, 2));
    const auto seen = tokens(application);
    EXPECT_EQ(seen.size(), 2U);
    EXPECT_NE(seen[0], seen[1]);
}

TEST_F(Received, anAccountThatComesLaterIsNoticed)
{
    startServer();
    makeAccount();
    startService();
    {
        const RecordingApplication application;
        share({makeFile("a.jpg", 100)});
        ASSERT_TRUE(waitForTokens(application, 1));
    }
    const std::string account = folder_ + "/account.json";
    const std::string aside = folder_ + "/aside.json";
    std::filesystem::rename(account, aside);
    ASSERT_TRUE(runUntil([&] { return infoOf(std::string(22, 'x')).result != 0; }));
    std::filesystem::rename(aside, account);
    const RecordingApplication application;
    share({makeFile("b.jpg", 100)});
    EXPECT_TRUE(waitForTokens(application, 1));
}

TEST_F(Received, aShareThatIsTakenBackSaysSoEverywhere)
{
    start();
    const RecordingApplication application;
    const int32_t id = share({makeFile("a.jpg", 100)});
    ASSERT_TRUE(waitForTokens(application, 1));
    const std::string token = tokens(application)[0];
    EXPECT_EQ(resultOf([&](auto done, void *data) {
                  return pelliko_shares_withdraw(id, done, data, nullptr);
              }),
              0);
    ASSERT_TRUE(runUntil([&] { return sentList()[0].state == PELLIKO_SHARE_WITHDRAWN; }));
    const Saved saved = save(token);
    EXPECT_EQ(saved.result, PELLIKO_SHARES_ERROR_WITHDRAWN);
    EXPECT_THAT(saved.paths, IsEmpty());
    EXPECT_THAT(receivedList(), ElementsAre(std::pair(token, int(PELLIKO_SHARE_WITHDRAWN))));
    EXPECT_EQ(infoOf(token).result, PELLIKO_SHARES_ERROR_WITHDRAWN);
    EXPECT_EQ(resultOf([&](auto done, void *data) {
                  return pelliko_shares_forget_received(token.c_str(), done, data, nullptr);
              }),
              0);
    EXPECT_THAT(receivedList(), IsEmpty());
    EXPECT_EQ(resultOf([&](auto done, void *data) {
                  return pelliko_shares_forget_sent(id, done, data, nullptr);
              }),
              0);
    EXPECT_THAT(sentList(), IsEmpty());
    EXPECT_EQ(infoOf("unknownToken").result, PELLIKO_SHARES_ERROR_NOT_FOUND);
}

TEST_F(Received, nothingOfAHotelsNetworkIsTakenForTheServersAnswer)
{
    startServer();
    std::vector<std::string> rules(3, hotelPage("GET", "/push$"));
    rules.push_back(hotelPage("POST", "/push/ack$"));
    for (const std::string method : {"GET", "DELETE"}) {
        rules.push_back(answers(method, "/received/[^/]+$", 404));
        rules.push_back(hotelPage(method, "/received/[^/]+$"));
    }
    // As long as the file, and all of it and the rest of it.
    const std::string bytes = R"("length": 70000)";
    rules.push_back(rule("GET", "/files/0$", "cut", R"("after": 30000)"));
    rules.push_back(answers("GET", "/files/0$", 200, bytes));
    rules.push_back(answers("GET", "/files/0$", 206, bytes));
    startFaults(plan(rules));
    startService();
    const RecordingApplication application;
    const std::string file = makeFile("one.jpg", 70'000);
    share({file});
    ASSERT_TRUE(waitForTokens(application, 1));
    const std::string token = tokens(application)[0];
    const Saved saved = save(token);
    EXPECT_EQ(saved.result, 0);
    ASSERT_EQ(saved.paths.size(), 1U);
    EXPECT_TRUE(contentOf(saved.paths[0]) == contentOf(file));
    EXPECT_EQ(resultOf([&](auto done, void *data) {
                  return pelliko_shares_forget_received(token.c_str(), done, data, nullptr);
              }),
              0);
    ASSERT_TRUE(runUntil([&] {
        return JsonValue::parse(askServer("GET", "/api/v1/received"))["received"].size() == 0;
    }));
    std::vector<int64_t> streams;
    size_t met = 0;
    for (const SeenExchange &seen : exchanges()) {
        met += seen.fault.empty() ? 0 : 1;
        if (seen.request == "GET /api/v1/push" && !seen.fault.empty()) {
            streams.push_back(seen.at);
        }
    }
    EXPECT_EQ(met, rules.size());
    ASSERT_EQ(streams.size(), 3U);
    EXPECT_GE(streams[2] - streams[1], 100) << "a page is no success: the waits grow";
}

TEST_F(Received, aServerThatGoesWhileAFileIsSavedIsWaitedForThenTheRestIsFetched)
{
    start();
    const RecordingApplication application;
    const std::string film = makeFile("film.mp4", 30'000'000);
    share({film});
    ASSERT_TRUE(waitForTokens(application, 1));
    const std::string token = tokens(application)[0];
    // A part as an interrupted download leaves it: the rest is asked for.
    Saved saved;
    ASSERT_EQ(pelliko_shares_download(token.c_str(), 0, downloads().c_str(), onBytes, onSaved,
                                      &saved, nullptr),
              0);
    ASSERT_TRUE(runUntil([&] { return saved.done > 0 || saved.over; }));
    server_->end(SIGKILL);
    if (!saved.over) {
        startServer();
    }
    ASSERT_TRUE(runUntil([&] { return saved.over; }, 60));
    EXPECT_EQ(saved.result, 0);
    ASSERT_EQ(saved.paths.size(), 1U);
    EXPECT_TRUE(contentOf(saved.paths[0]) == contentOf(film));
}

TEST_F(Received, aServerThatStaysAwayIsToldApartAndNothingHalfHasAName)
{
    start();
    const RecordingApplication application;
    share({makeFile("a.jpg", 100)});
    ASSERT_TRUE(waitForTokens(application, 1));
    server_->end(SIGKILL);
    const Saved saved = save(tokens(application)[0]);
    EXPECT_EQ(saved.result, PELLIKO_SHARES_ERROR_UNREACHABLE);
    EXPECT_THAT(saved.paths, IsEmpty());
    EXPECT_EQ(infoOf(tokens(application)[0]).result, 0) << "what is known needs no server";
}

TEST_F(Received, aContactThatHasJoinedIsMarkedAlsoWhenItComesLater)
{
    startServer();
    makeAccount();
    const std::string tool = PELLIKO_BUILD_DIR "/bin/contacts-tool";
    outputOf({tool, "add", "--name", "Joined One", "--number", "07700 900777"});
    outputOf({tool, "add", "--name", "Other One", "--number", "07700 900778"});
    outputOf({PELLIKO_BUILD_DIR "/bin/pelliko-server", "account", "add", "--data",
              folder_ + "/server", "--number", "+447700900777"});
    const auto joined = [&](const std::string &name) {
        const auto list = pelliko::test::JsonValue::parse(outputOf({tool, "list", "--json"}));
        for (size_t i = 0; i < list.size(); ++i) {
            if (list[i]["name"] == name) {
                return list[i]["joined"] == true;
            }
        }
        return false;
    };
    // What the service writes wakes this loop.
    const std::string store = std::string(std::getenv("XDG_DATA_HOME")) + "/pelliko-platform";
    g_autoptr(GFile) folder = g_file_new_for_path(store.c_str());
    g_autoptr(GFileMonitor) monitor =
        g_file_monitor_directory(folder, G_FILE_MONITOR_NONE, nullptr, nullptr);
    startService();
    ASSERT_TRUE(runUntil([&] { return joined("Joined One"); }));
    EXPECT_FALSE(joined("Other One"));
    // A contact that comes later is noticed.
    outputOf({PELLIKO_BUILD_DIR "/bin/pelliko-server", "account", "add", "--data",
              folder_ + "/server", "--number", "+447700900779"});
    outputOf({tool, "add", "--name", "Late One", "--number", "+447700900779"});
    EXPECT_TRUE(runUntil([&] { return joined("Late One"); }));
}
