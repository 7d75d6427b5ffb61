#include "TransferThread.h"

#include "CurlTransfer.h"
#include "LoopTask.h"

#include <mutex>
#include <thread>
#include <utility>

namespace pelliko::service
{
namespace
{
constexpr int idleWaitMs = 600'000; // the thread is woken for everything that matters
// Eight for transfers, and the push stream.
constexpr long connectionsPerHost = 9;
} // namespace

// What runs on the thread. Orders come through a list under a lock, results go to the main loop.
class TransferThread::Loop
{
public:
    Loop(std::weak_ptr<TransferThread *> owner, TransferLimits limits)
        : owner_(std::move(owner)), limits_(limits), multi_(curl_multi_init()),
          thread_([this] { run(); })
    {
    }

    ~Loop()
    {
        {
            const std::lock_guard lock(mutex_);
            stop_ = true;
        }
        curl_multi_wakeup(multi_);
        thread_.join();
        curl_multi_cleanup(multi_);
    }

    void add(uint64_t number, HttpRequest request)
    {
        order([this, number, request = std::move(request)]() mutable {
            begin(number, std::move(request));
        });
    }

    void remove(uint64_t number)
    {
        order([this, number] { end(number); });
    }

private:
    void order(LoopTask task)
    {
        {
            const std::lock_guard lock(mutex_);
            orders_.push_back(std::move(task));
        }
        curl_multi_wakeup(multi_);
    }

    void run()
    {
        curl_multi_setopt(multi_, CURLMOPT_MAX_HOST_CONNECTIONS, connectionsPerHost);
        while (takeOrders()) {
            int running = 0;
            curl_multi_perform(multi_, &running);
            readResults();
            curl_multi_poll(multi_, nullptr, 0, idleWaitMs, nullptr);
        }
        while (!transfers_.empty()) {
            end(transfers_.begin()->first);
        }
    }

    bool takeOrders()
    {
        std::vector<LoopTask> orders;
        {
            const std::lock_guard lock(mutex_);
            if (stop_) {
                return false;
            }
            orders.swap(orders_);
        }
        for (LoopTask &task : orders) {
            task();
        }
        return true;
    }

    void begin(uint64_t number, HttpRequest request)
    {
        auto transfer = std::make_unique<CurlTransfer>(
            number, std::move(request),
            [this, number](int64_t bytes) {
                post([number, bytes](TransferThread &owner) { owner.onProgress(number, bytes); });
            },
            limits_);
        curl_multi_add_handle(multi_, transfer->handle());
        transfers_[number] = std::move(transfer);
    }

    void end(uint64_t number)
    {
        const auto found = transfers_.find(number);
        if (found != transfers_.end()) {
            curl_multi_remove_handle(multi_, found->second->handle());
            transfers_.erase(found);
        }
    }

    void readResults()
    {
        int left = 0;
        while (const CURLMsg *message = curl_multi_info_read(multi_, &left)) {
            if (message->msg != CURLMSG_DONE) {
                continue;
            }
            CurlTransfer *transfer = nullptr;
            const CURLcode result = message->data.result;
            curl_easy_getinfo(message->easy_handle, CURLINFO_PRIVATE, &transfer);
            const uint64_t number = transfer->number();
            post([number, answer = transfer->answer(result)](TransferThread &owner) {
                owner.onDone(number, answer);
            });
            end(number);
        }
    }

    void post(std::function<void(TransferThread &)> task)
    {
        onMainLoop([owner = owner_, task = std::move(task)] {
            if (const auto alive = owner.lock()) {
                task(**alive);
            }
        });
    }

    std::weak_ptr<TransferThread *> owner_;
    TransferLimits limits_;
    std::mutex mutex_;
    std::vector<LoopTask> orders_;
    bool stop_ = false;
    std::map<uint64_t, std::unique_ptr<CurlTransfer>> transfers_;
    CURLM *multi_;
    std::thread thread_;
};

TransferThread::TransferThread(TransferLimits limits)
    : self_(std::make_shared<TransferThread *>(this))
{
    static std::once_flag once;
    std::call_once(once, [] { curl_global_init(CURL_GLOBAL_DEFAULT); });
    loop_ = std::make_unique<Loop>(self_, limits);
}

TransferThread::~TransferThread() = default;

uint64_t TransferThread::send(HttpRequest request, Progress progress, Done done)
{
    const uint64_t number = ++lastNumber_;
    callbacks_[number] = {std::move(progress), std::move(done)};
    loop_->add(number, std::move(request));
    return number;
}

void TransferThread::cancel(uint64_t transfer)
{
    if (callbacks_.erase(transfer) != 0) {
        loop_->remove(transfer);
    }
}

void TransferThread::onProgress(uint64_t transfer, int64_t bytes)
{
    const auto found = callbacks_.find(transfer);
    if (found != callbacks_.end() && found->second.progress) {
        const Progress progress = found->second.progress;
        progress(bytes);
    }
}

void TransferThread::onDone(uint64_t transfer, const HttpAnswer &answer)
{
    const auto found = callbacks_.find(transfer);
    if (found == callbacks_.end()) {
        return;
    }
    const Callbacks callbacks = std::move(found->second);
    callbacks_.erase(found);
    callbacks.done(answer);
}

} // namespace pelliko::service
