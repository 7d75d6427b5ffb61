#pragma once

#include "Backoff.h"
#include "RequestContext.h"

namespace pelliko::service
{

/**
 * Has the application send the messages of a finished share. Each step is on disk before the next:
 * a launch whose answer is stored is never repeated, one without is; the application knows what it
 * has sent. Ends when it is destroyed.
 */
class SmsDelivery
{
public:
    /** @param request has the state notifying; its SMS fields are kept up to date */
    SmsDelivery(RequestContext &context, QueuedRequest &request);
    ~SmsDelivery();
    SmsDelivery(const SmsDelivery &) = delete;
    SmsDelivery &operator=(const SmsDelivery &) = delete;

    /** Begins. @param done receives whether the messages are settled; not called from inside */
    void start(std::function<void(bool received)> done);

private:
    void launch();
    void onResult(LaunchResult result);
    void onReceived();
    bool store(SmsState state, int attempts);
    void again(std::function<void()> step);
    void giveUp(const char *reason);

    RequestContext &context_;
    QueuedRequest &request_;
    Backoff backoff_;
    std::function<void(bool)> done_;
    uint64_t timer_ = 0;
    std::shared_ptr<bool> alive_ = std::make_shared<bool>(true);
};

} // namespace pelliko::service
