// A user who shares with the own number, and all that then can be asked for
#pragma once

#include "World.h"
#include "pelliko_shares.h"

#include <functional>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

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
    static constexpr const char *self = "+447700900100";

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
            if (launch.operation == "http://tizen.org/appcontrol/operation/send") {
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
