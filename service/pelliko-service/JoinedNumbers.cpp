#include "JoinedNumbers.h"

#include "UploadQueue.h"

#include <SQLiteCpp/SQLiteCpp.h>
#include <SQLiteCpp/VariadicBind.h>

#include <algorithm>

namespace pelliko::service
{
namespace
{
constexpr int64_t daySeconds = 24LL * 3600;
}

JoinedNumbers::JoinedNumbers(UploadQueue &queue) : db_(queue.database()) {}

std::map<std::string, JoinedNumbers::Answer> JoinedNumbers::answers(const std::string &server)
{
    SQLite::Statement query(db_,
                            "SELECT e164, joined, marked FROM joined_numbers WHERE server = ?");
    query.bind(1, server);
    std::map<std::string, Answer> result;
    while (query.executeStep()) {
        result[query.getColumn(0).getString()] = {query.getColumn(1).getInt() != 0,
                                                  query.getColumn(2).getInt() != 0};
    }
    return result;
}

std::vector<std::string> JoinedNumbers::due(const std::set<std::string> &numbers,
                                            const std::string &server, int64_t before, size_t most)
{
    SQLite::Statement query(db_, "SELECT e164, asked_at FROM joined_numbers WHERE server = ?");
    query.bind(1, server);
    std::map<std::string, int64_t> askedAt;
    while (query.executeStep()) {
        askedAt[query.getColumn(0).getString()] = query.getColumn(1).getInt64();
    }
    std::vector<std::pair<int64_t, std::string>> open;
    for (const std::string &number : numbers) {
        const auto found = askedAt.find(number);
        const int64_t at = found == askedAt.end() ? 0 : found->second;
        if (at < before) {
            open.emplace_back(at, number);
        }
    }
    std::sort(open.begin(), open.end());
    open.resize(std::min(open.size(), most));
    std::vector<std::string> result;
    result.reserve(open.size());
    for (auto &[at, number] : open) {
        result.push_back(std::move(number));
    }
    return result;
}

int64_t JoinedNumbers::askedSince(int64_t epochSeconds)
{
    SQLite::Statement query(db_, "SELECT coalesce(sum(numbers), 0) FROM joined_questions"
                                 " WHERE asked_at > ?");
    query.bind(1, epochSeconds);
    query.executeStep();
    return query.getColumn(0).getInt64();
}

void JoinedNumbers::noteQuestion(int64_t now, size_t count)
{
    SQLite::Transaction transaction(db_, SQLite::TransactionBehavior::IMMEDIATE);
    SQLite::Statement drop(db_, "DELETE FROM joined_questions WHERE asked_at <= ?");
    drop.bind(1, now - daySeconds);
    drop.exec();
    SQLite::Statement insert(db_, "INSERT INTO joined_questions VALUES (?, ?)");
    SQLite::bind(insert, now, static_cast<int64_t>(count));
    insert.exec();
    transaction.commit();
}

void JoinedNumbers::noteAnswers(const std::string &server, const std::set<std::string> &asked,
                                const std::set<std::string> &joined, int64_t now)
{
    SQLite::Transaction transaction(db_, SQLite::TransactionBehavior::IMMEDIATE);
    SQLite::Statement insert(
        db_, "INSERT INTO joined_numbers (e164, server, joined, asked_at) VALUES (?, ?, ?, ?)"
             " ON CONFLICT (e164) DO UPDATE SET server = excluded.server,"
             " joined = excluded.joined, asked_at = excluded.asked_at");
    for (const std::string &number : asked) {
        SQLite::bind(insert, number, server, joined.count(number) != 0 ? 1 : 0, now);
        insert.exec();
        insert.reset();
    }
    transaction.commit();
}

void JoinedNumbers::setMarked(const std::set<std::string> &numbers, bool marked)
{
    SQLite::Transaction transaction(db_, SQLite::TransactionBehavior::IMMEDIATE);
    SQLite::Statement update(db_, "UPDATE joined_numbers SET marked = ? WHERE e164 = ?");
    for (const std::string &number : numbers) {
        SQLite::bind(update, marked ? 1 : 0, number);
        update.exec();
        update.reset();
    }
    transaction.commit();
}

} // namespace pelliko::service
