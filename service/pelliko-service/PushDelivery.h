// Brings new received shares to the application
#pragma once

#include "Backoff.h"
#include "ReceivedJournal.h"
#include "RequestContext.h"
#include "ServerRest.h"

namespace pelliko::service
{

/**
 * Brings what the journal has of new pushes to the application: asks the server for each share,
 * then launches the application with all that wait. One launch at a time; repeated until it is
 * confirmed.
 */
class PushDelivery
{
public:
    /** @param changed called when the journal has a share more, or knows more of one */
    PushDelivery(RequestContext &context, ReceivedJournal &journal, std::function<void()> changed);
    ~PushDelivery();
    PushDelivery(const PushDelivery &) = delete;
    PushDelivery &operator=(const PushDelivery &) = delete;

    /** There may be something to do, or a network to do it over. */
    void kick();

private:
    void next();
    bool askForUnread();
    void onShare(const std::string &token, const HttpAnswer &answer);
    void launch();
    void onLaunched(const std::vector<ReceivedJournal::Untold> &tokens, LaunchResult result);
    void again(Backoff &backoff, int64_t restMs = 0);
    void nextAfter(int64_t milliseconds);

    RequestContext &context_;
    ReceivedJournal &journal_;
    std::function<void()> changed_;
    Backoff backoff_;
    ServerRest rest_;
    Backoff launchBackoff_;
    uint64_t transfer_ = 0;
    uint64_t timer_ = 0;
    bool launching_ = false;
    std::shared_ptr<bool> alive_ = std::make_shared<bool>(true);
};

} // namespace pelliko::service
