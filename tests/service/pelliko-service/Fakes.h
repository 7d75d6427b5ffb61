#pragma once

#include "RequestContext.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <map>

namespace pelliko::service
{

/** Time that passes only when a test says so. */
class HandTimers : public Timers
{
public:
    uint64_t after(int64_t milliseconds, std::function<void()> task) override
    {
        tasks_[{now_ + milliseconds, ++last_}] = std::move(task);
        return last_;
    }
    void cancel(uint64_t timer) override
    {
        std::erase_if(tasks_, [timer](const auto &entry) { return entry.first.second == timer; });
    }
    int64_t steadyMs() const override { return now_; }
    int64_t epochSeconds() const override { return 1'000'000 + now_ / 1000; }

    /** Lets time pass and runs what is due, in order. */
    void pass(int64_t milliseconds)
    {
        const int64_t until = now_ + milliseconds;
        while (!tasks_.empty() && tasks_.begin()->first.first <= until) {
            now_ = tasks_.begin()->first.first;
            const auto task = tasks_.begin()->second;
            tasks_.erase(tasks_.begin());
            task();
        }
        now_ = until;
    }
    /** How long until the next task, -1 without one. */
    int64_t next() const { return tasks_.empty() ? -1 : tasks_.begin()->first.first - now_; }

private:
    int64_t now_ = 5'000;
    uint64_t last_ = 0;
    std::map<std::pair<int64_t, uint64_t>, std::function<void()>> tasks_;
};

/** Requests wait here until the test answers them. */
class HandHttp : public HttpSender
{
public:
    struct Sent {
        HttpRequest request;
        Progress progress;
        Done done;
    };

    uint64_t send(HttpRequest request, Progress progress, Done done) override
    {
        ++count;
        open[count] = {std::move(request), std::move(progress), std::move(done)};
        return count;
    }
    void cancel(uint64_t transfer) override { open.erase(transfer); }

    /** Answers the oldest request. */
    void answer(long status, const std::string &body,
                std::map<std::string, std::string> headers = {})
    {
        finish({{}, status, body, std::move(headers)});
    }
    /** Answers the oldest request for that address. */
    void answerTo(const std::string &end, long status, const std::string &body)
    {
        const auto found = to(end);
        ASSERT_NE(found, open.end()) << end;
        const Done done = found->second.done;
        open.erase(found);
        done({{}, status, body, {}});
    }
    bool asked(const std::string &end) { return to(end) != open.end(); }
    std::map<uint64_t, Sent>::iterator to(const std::string &end)
    {
        return std::find_if(open.begin(), open.end(), [&end](const auto &entry) {
            return entry.second.request.url.ends_with(end);
        });
    }
    void refuseConnection() { finish({"unreachable", 0, {}, {}}); }
    const HttpRequest &oldest() const { return open.begin()->second.request; }

    std::map<uint64_t, Sent> open;
    uint64_t count = 0;

private:
    void finish(const HttpAnswer &answer)
    {
        ASSERT_FALSE(open.empty());
        const Done done = open.begin()->second.done;
        open.erase(open.begin());
        done(answer);
    }
};

class HandGate : public NetworkGate
{
public:
    bool open(const std::string &, bool wifiOnly) const override
    {
        return network && !(wifiOnly && metered);
    }
    bool network = true;
    bool metered = false;
};

class HandLauncher : public Launcher
{
public:
    void launchSms(const SmsLaunch &launch, std::function<void(LaunchResult)> done) override
    {
        launches.push_back(launch);
        answer = std::move(done);
    }
    void launchPush(const std::vector<std::string> &tokens,
                    std::function<void(LaunchResult)> done) override
    {
        pushes.push_back(tokens);
        answerPush = std::move(done);
    }
    void launchResume(const std::vector<int32_t> &ids, std::function<void(bool)> done) override
    {
        resumes.push_back(ids);
        answerResume = std::move(done);
    }

    std::vector<SmsLaunch> launches;
    std::function<void(LaunchResult)> answer;
    std::vector<std::vector<std::string>> pushes;
    std::function<void(LaunchResult)> answerPush;
    std::vector<std::vector<int32_t>> resumes;
    std::function<void(bool)> answerResume;
};

/** A folder that goes with the test. */
class Folder
{
public:
    Folder()
    {
        std::string pattern = testing::TempDir() + "/pelliko.XXXXXX";
        path_ = mkdtemp(pattern.data());
    }
    ~Folder() { std::filesystem::remove_all(path_); }
    Folder(const Folder &) = delete;
    Folder &operator=(const Folder &) = delete;

    std::string file(const std::string &name) const { return path_ + "/" + name; }
    std::string make(const std::string &name, const std::string &content) const
    {
        std::ofstream(file(name)) << content;
        return file(name);
    }

private:
    std::string path_;
};

/** Everything that a request works with, in the test's hands, over a real queue. */
struct Hands {
    Folder folder;
    HandTimers timers;
    HandHttp http;
    HandGate gate;
    HandLauncher launcher;
    Settings settings;
    UploadQueue queue{folder.file("queue.db")};
    std::optional<Account> account{Account{"http://server", "+447700900100", "token"}};
    RequestContext context{queue,
                           http,
                           timers,
                           gate,
                           launcher,
                           settings,
                           [this] { return account; },
                           [] { return 1.0; }};

    /** A queued request for one file of that content. */
    QueuedRequest queued(const std::string &content, bool wifiOnly = false,
                         std::vector<Recipient> recipients = {{"44", "+447700900111", 7}})
    {
        QueuedFile file{folder.make("photo.jpg", content), {}};
        stampOf(file.path, file.stamp);
        const int32_t id = queue.add({{file}, std::move(recipients), wifiOnly, {}, 1});
        return *queue.find(id);
    }
};

} // namespace pelliko::service
