#include "store/PostgresMetadata.h"
#include "store/PostgresRows.h"

#include <set>

namespace pelliko::server
{
namespace
{

/// Seconds until the question fits the account's limit; nothing when it fits now.
std::optional<Seconds> waitForNumbers(PostgresConnection &db, const JoinedQuestion &question)
{
    PostgresRows rows = db.query("SELECT at, numbers FROM questions"
                                 " WHERE account = $1 AND at > $2 ORDER BY at",
                                 question.account, question.now - question.limitWindow);
    std::vector<Use> uses;
    while (rows.next())
        uses.push_back({rows.integer(0), rows.size(1)});
    return waitForRoom(question.numbers.size(), uses,
                       {question.dailyLimit, question.limitWindow, question.now});
}

std::vector<std::string> joinedOf(PostgresConnection &db, const std::vector<std::string> &numbers)
{
    PostgresRows rows = db.query("SELECT number FROM accounts WHERE number = ANY ($1)", numbers);
    std::set<std::string> found;
    while (rows.next())
        found.insert(rows.text(0));
    std::vector<std::string> joined;
    for (const std::string &number : numbers) {
        if (found.count(number) != 0)
            joined.push_back(number);
    }
    return joined;
}

} // namespace

JoinedAnswer PostgresMetadata::askJoined(const JoinedQuestion &question)
{
    return m_pool->write([&](PostgresConnection &db) -> JoinedAnswer {
        lockAccount(db, question.account);
        if (const auto wait = waitForNumbers(db, question))
            return {false, {}, *wait};
        // The questions of one second share a row: many small ones cost no more than few large
        // ones.
        db.query("INSERT INTO questions AS q (account, at, numbers) VALUES ($1, $2, $3)"
                 " ON CONFLICT (account, at) DO UPDATE SET numbers = q.numbers + excluded.numbers",
                 question.account, question.now, question.numbers.size());
        return {true, joinedOf(db, question.numbers), 0};
    });
}

} // namespace pelliko::server
