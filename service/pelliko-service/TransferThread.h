#pragma once

#include "Http.h"

#include <memory>

namespace pelliko::service
{

/** Sends requests through libcurl on a thread of its own; everything public belongs to the main
 * loop. */
class TransferThread : public HttpSender
{
public:
    explicit TransferThread(TransferLimits limits);
    ~TransferThread() override;

    uint64_t send(HttpRequest request, Progress progress, Done done) override;
    void cancel(uint64_t transfer) override;

private:
    struct Callbacks {
        Progress progress;
        Done done;
    };
    class Loop;

    void onProgress(uint64_t transfer, int64_t bytes);
    void onDone(uint64_t transfer, const HttpAnswer &answer);

    std::map<uint64_t, Callbacks> callbacks_;
    uint64_t lastNumber_ = 0;
    std::shared_ptr<TransferThread *> self_; // emptied when this ends, for what is still on its way
    std::unique_ptr<Loop> loop_;
};

} // namespace pelliko::service
