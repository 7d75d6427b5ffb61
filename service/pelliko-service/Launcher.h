#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

namespace pelliko::service
{

/** What the application is told when its messages are wanted. */
struct SmsLaunch {
    int32_t id = 0;
    std::string key; ///< the same for every launch of this share, and of no other
    std::string url;
    std::string from; ///< the user's own number
    int64_t expires = 0;
    int fileCount = 0;
    std::vector<std::string> numbers;
};

enum class LaunchResult {
    received, ///< the application has taken the launch; for messages: it has settled them all
    notSent,  ///< the application surely did not get it, or said that it must be asked again
    unknown   ///< the answer is missing; the application may have got it
};

/** Launches the application. Belongs to the main loop; the results come from there, never from
 * inside a call. */
class Launcher
{
public:
    virtual ~Launcher() = default;

    /** Asks for a share's messages; the answer comes when the last of them is settled. A repeated
     * launch sends only what is still owed. */
    virtual void launchSms(const SmsLaunch &launch, std::function<void(LaunchResult)> done) = 0;

    /** Tells of received shares. */
    virtual void launchPush(const std::vector<std::string> &tokens,
                            std::function<void(LaunchResult)> done) = 0;

    /** @param done receives whether the application answered that it takes the ids over */
    virtual void launchResume(const std::vector<int32_t> &ids, std::function<void(bool)> done) = 0;
};

} // namespace pelliko::service
