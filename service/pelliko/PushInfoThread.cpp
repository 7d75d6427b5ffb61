#include "PushInfoThread.h"

#include "ServiceProxy.h"
#include "pelliko_shares.h"

#include <chrono>
#include <condition_variable>
#include <deque>
#include <mutex>
#include <thread>
#include <utility>

namespace pelliko::client
{
namespace
{
constexpr const char *busName = "com.velmora.pelliko.Service";
constexpr const char *objectPath = "/com/velmora/pelliko/Service";
constexpr const char *interfaceName = "com.velmora.pelliko.Shares1";
constexpr size_t longestToken = 24;
constexpr int callTimeoutMs = 90'000; // the service gives its server up before that
constexpr int mostAttempts = 4;
constexpr std::chrono::milliseconds firstWait{250};

GVariant *emptyShare()
{
    return g_variant_ref_sink(g_variant_new_array(G_VARIANT_TYPE("{sv}"), nullptr, 0));
}

/** One question to the service. @param share receives what it answers @return an error code */
int askOnce(const std::string &token, GVariant **share)
{
    g_autoptr(GError) error = nullptr;
    g_autoptr(GDBusConnection) bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, &error);
    g_autoptr(GVariant) reply =
        bus ? g_dbus_connection_call_sync(bus, busName, objectPath, interfaceName, "GetReceived",
                                          g_variant_new("(sb)", token.c_str(), FALSE),
                                          G_VARIANT_TYPE("(ia{sv})"), G_DBUS_CALL_FLAGS_NONE,
                                          callTimeoutMs, nullptr, &error)
            : nullptr;
    gint result = 0;
    if (reply) {
        g_variant_get(reply, "(i@a{sv})", &result, share);
        return result;
    }
    return codeOf(error);
}

class Thread
{
public:
    void add(std::string token, ShareAnswer answer)
    {
        const std::lock_guard lock(mutex_);
        if (!thread_.joinable()) {
            thread_ = std::thread([this] { run(); });
        }
        questions_.push_back({std::move(token), std::move(answer)});
        arrived_.notify_one();
    }

private:
    struct Question {
        std::string token;
        ShareAnswer answer;
    };

    void run()
    {
        for (;;) {
            const Question question = next();
            GVariant *share = nullptr;
            const int error = ask(question.token, &share);
            if (!share) {
                share = emptyShare();
            }
            question.answer(error, share);
            g_variant_unref(share);
        }
    }

    Question next()
    {
        std::unique_lock lock(mutex_);
        arrived_.wait(lock, [this] { return !questions_.empty(); });
        Question question = std::move(questions_.front());
        questions_.pop_front();
        return question;
    }

    // A service that is just being started again, or still loads, answers a moment later.
    static int ask(const std::string &token, GVariant **share)
    {
        const bool possible = !token.empty() && token.size() <= longestToken &&
                              g_utf8_validate(token.c_str(), -1, nullptr);
        if (!possible) {
            return PELLIKO_SHARES_ERROR_NOT_FOUND;
        }
        auto wait = firstWait;
        for (int attempt = 1;; ++attempt) {
            const int error = askOnce(token, share);
            const bool away = error == PELLIKO_ERROR_SERVICE_NOT_RUNNING ||
                              error == PELLIKO_ERROR_SERVICE_INITIALIZING;
            if (!away || attempt == mostAttempts) {
                return error;
            }
            std::this_thread::sleep_for(wait);
            wait *= 2;
        }
    }

    std::mutex mutex_;
    std::condition_variable arrived_;
    std::deque<Question> questions_;
    std::thread thread_;
};
} // namespace

void askOnThread(std::string token, ShareAnswer answer)
{
    // Never destroyed: the process may end while an answer is being handled.
    static Thread &thread = *new Thread;
    thread.add(std::move(token), std::move(answer));
}

} // namespace pelliko::client
