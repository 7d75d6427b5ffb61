#include "store/ShareRow.h"
#include "store/SqliteConnection.h"

namespace pelliko::server
{

std::optional<Seconds> SqliteMetadata::Connection::waitForNumbers(const JoinedQuestion &question)
{
    std::vector<Use> uses;
    Query rows = query("SELECT at, numbers FROM questions WHERE account = ? AND at > ? ORDER BY at",
                       question.account, question.now - question.limitWindow);
    while (rows.next())
        uses.push_back({rows.integer(0), rows.size(1)});
    return waitForRoom(question.numbers.size(), uses,
                       {question.dailyLimit, question.limitWindow, question.now});
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
