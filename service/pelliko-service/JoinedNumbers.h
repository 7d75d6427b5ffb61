// What the server said about who has joined, on disk
#pragma once

#include <cstdint>
#include <map>
#include <set>
#include <string>
#include <vector>

namespace SQLite
{
class Database;
}

namespace pelliko::service
{

class UploadQueue;

/**
 * The server's answers about the numbers of the contacts, in the queue's file, and how many it was
 * asked for. Every change is on disk when the call returns. Belongs to the main loop; throws
 * std::exception when the disk fails.
 */
class JoinedNumbers
{
public:
    struct Answer {
        bool joined = false;
        bool marked = false; ///< the contacts store was told that the number has joined
    };

    explicit JoinedNumbers(UploadQueue &queue);

    /** Answers of that server. */
    std::map<std::string, Answer> answers(const std::string &server);

    /** Which of the numbers to ask for: those without an answer first, then those whose answer is
     * the oldest of those from before that time. @param most how many at most */
    std::vector<std::string> due(const std::set<std::string> &numbers, const std::string &server,
                                 int64_t before, size_t most);

    /** How many numbers were asked for since then. */
    int64_t askedSince(int64_t epochSeconds);
    /** Notes a question before it is asked. */
    void noteQuestion(int64_t now, size_t count);

    void noteAnswers(const std::string &server, const std::set<std::string> &asked,
                     const std::set<std::string> &joined, int64_t now);
    void setMarked(const std::set<std::string> &numbers, bool marked);

private:
    SQLite::Database &db_;
};

} // namespace pelliko::service
