#pragma once

#include "Backoff.h"
#include "RequestContext.h"
#include "ServerRest.h"

namespace pelliko::service
{

/** Takes the shares of cancelled and failed requests off the server, one after the other, until it
 * is done. */
class Withdrawals
{
public:
    /** @param changed called when a share is off the server */
    Withdrawals(RequestContext &context, std::function<void()> changed);
    ~Withdrawals();
    Withdrawals(const Withdrawals &) = delete;
    Withdrawals &operator=(const Withdrawals &) = delete;

    /** There may be something to do, or a network to do it over. */
    void kick();

private:
    void next();
    void findShare(const Account &account, const QueuedRequest &request);
    void onFound(const HttpAnswer &answer);
    void withdraw(const Account &account, const std::string &share);
    void onWithdrawn(const HttpAnswer &answer);
    void done();
    void again(int64_t restMs = 0);
    void nextAfter(int64_t milliseconds);

    RequestContext &context_;
    std::function<void()> changed_;
    Backoff backoff_;
    ServerRest rest_;
    int32_t current_ = 0;
    uint64_t transfer_ = 0;
    uint64_t timer_ = 0;
};

} // namespace pelliko::service
