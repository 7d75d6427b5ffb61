// The launch requests that wait for the outcome of a sign-in.
#pragma once

#include <app_control.h>
#include <kor_account.h>

#include <string>
#include <vector>

namespace pelliko::signin
{

/// Keeps requests for a sign-in and answers all of them alike. Main loop only.
class LaunchReplies
{
public:
    LaunchReplies() = default;
    /// The platform answers what is still open as cancelled.
    ~LaunchReplies();
    LaunchReplies(const LaunchReplies &) = delete;
    LaunchReplies &operator=(const LaunchReplies &) = delete;

    /// Keeps the request when it asks for a sign-in; false for every other operation.
    bool take(app_control_h request);
    bool waiting() const { return !requests_.empty(); }

    /// Tells who the user is. The token itself is not told: the caller of a launch may be anybody,
    /// and replies show up in traces of the bus.
    void succeed(const korrin::Account &account);
    void fail(const std::string &code, const std::string &message);
    void cancel();

private:
    void answer(app_control_h reply, app_control_result_e result);

    std::vector<app_control_h> requests_;
};

} // namespace pelliko::signin
