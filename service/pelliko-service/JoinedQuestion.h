// Asks the server which numbers have joined, batch after batch
#pragma once

#include "ShareApi.h"
#include "Timers.h"

#include <functional>
#include <set>
#include <string>
#include <vector>

namespace pelliko::service
{

/** What came of a question; a part of the numbers when the server did not answer for all. */
struct JoinedFindings {
    std::set<std::string> asked; ///< those that the server has answered for
    std::set<std::string> joined;
    bool refused = false;    ///< the server does not want to be asked more now
    int64_t waitSeconds = 0; ///< when refused: for how long, 0 when it did not say
};

/** One question to the server about any count of numbers. Belongs to the main loop; ends when it is
 * destroyed. */
class JoinedQuestion
{
public:
    using Done = std::function<void(const JoinedFindings &)>;

    JoinedQuestion(HttpSender &http, Timers &timers, Account account);
    ~JoinedQuestion();
    JoinedQuestion(const JoinedQuestion &) = delete;
    JoinedQuestion &operator=(const JoinedQuestion &) = delete;

    /**
     * Asks, once in the life of the object. Whatever the server does, the answer comes within a few
     * seconds per batch.
     * @param numbers E.164, each once, one at least
     * @param done    not called from inside; may destroy the object
     */
    void ask(std::vector<std::string> numbers, Done done);

private:
    void next();
    void onAnswer(const HttpAnswer &answer);
    void finish();

    HttpSender &http_;
    Timers &timers_;
    Account account_;
    std::vector<std::string> left_;
    std::vector<std::string> batch_;
    JoinedFindings findings_;
    Done done_;
    uint64_t transfer_ = 0;
    uint64_t timer_ = 0;
};

} // namespace pelliko::service
