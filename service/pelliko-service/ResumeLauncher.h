#pragma once

#include "Backoff.h"
#include "RequestContext.h"

#include <map>
#include <set>

namespace pelliko::service
{

/** What it needs to know of the requests. */
class Orphans
{
public:
    virtual ~Orphans() = default;
    virtual std::vector<int32_t> orphans() const = 0;
    virtual bool isOrphan(int32_t id) const = 0;
    virtual void abandon(int32_t id) = 0;
};

/**
 * Launches the application for requests that nobody listens to, and gives up those that it does not
 * claim although it was asked: at once when it still runs after the time to claim, else at the
 * second time.
 */
class ResumeLauncher
{
public:
    ResumeLauncher(RequestContext &context, Orphans &requests);
    ~ResumeLauncher();
    ResumeLauncher(const ResumeLauncher &) = delete;
    ResumeLauncher &operator=(const ResumeLauncher &) = delete;

    /** There may be orphans; they are looked at after that time. */
    void lookAfter(int64_t milliseconds);
    /** There may be orphans; they are looked at soon, later when launches did not help lately. */
    void lookSoon() { lookAfter(backoff_.next()); }
    /** Somebody listens to the request now. */
    void claimed(int32_t id);
    /** The application has ended. */
    void applicationGone();

private:
    enum class Step { idle, waiting, launched, claiming };

    void look();
    void onAnswer(bool taken);
    void onClaimTime();
    void onEndedWithoutClaim();
    void again();

    RequestContext &context_;
    Orphans &requests_;
    Backoff backoff_;
    Step step_ = Step::idle;
    uint64_t timer_ = 0;
    std::vector<int32_t> asked_;
    std::set<int32_t> launchedFor_; ///< by the last launch
    std::map<int32_t, int> missedClaims_;
    std::shared_ptr<bool> alive_ = std::make_shared<bool>(true);
};

} // namespace pelliko::service
