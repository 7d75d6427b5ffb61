#include "store/SqliteConnection.h"

namespace pelliko::server
{

std::optional<Seconds> SqliteMetadata::Connection::waitForNumbers(const JoinedQuestion &question)
{
    const Seconds since = question.now - question.limitWindow;
    std::uint64_t used = question.numbers.size();
    {
        Query sum = query("SELECT coalesce(sum(numbers), 0) FROM questions"
                          " WHERE account = ? AND at > ?",
                          question.account, since);
        used += sum.next() ? sum.size(0) : 0;
    }
    if (used <= question.dailyLimit)
        return std::nullopt;
    Query rows = query("SELECT at, numbers FROM questions WHERE account = ? AND at > ? ORDER BY at",
                       question.account, since);
    while (rows.next()) {
        used -= rows.size(1);
        if (used <= question.dailyLimit)
            return rows.integer(0) + question.limitWindow - question.now;
    }
    return question.limitWindow;
}

JoinedAnswer SqliteMetadata::askJoined(const JoinedQuestion &question)
{
    auto &db = *m_connection;
    return db.write([&]() -> JoinedAnswer {
        if (const auto wait = db.waitForNumbers(question))
            return {false, {}, *wait};
        // The questions of one second share a row: many small ones cost no more than few large
        // ones.
        db.query("INSERT INTO questions (account, at, numbers) VALUES (?, ?, ?)"
                 " ON CONFLICT (account, at) DO UPDATE SET numbers = numbers + excluded.numbers",
                 question.account, question.now, static_cast<std::int64_t>(question.numbers.size()))
            .run();
        JoinedAnswer answer;
        for (const std::string &number : question.numbers) {
            Query row = db.query("SELECT 1 FROM accounts WHERE number = ?", number);
            if (row.next())
                answer.joined.push_back(number);
        }
        return answer;
    });
}

} // namespace pelliko::server
