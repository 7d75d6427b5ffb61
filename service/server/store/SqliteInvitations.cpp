#include "store/SqliteConnection.h"

namespace pelliko::server
{

void SqliteMetadata::addInvitation(const NewInvitation &invitation)
{
    auto &db = *m_connection;
    db.write([&] {
        db.query("INSERT INTO invitations (code_hash, number, uses, created, expires)"
                 " VALUES (?, ?, ?, ?, ?)",
                 Bytes{invitation.codeHash}, invitation.number, invitation.uses, invitation.now,
                 invitation.expires)
            .run();
    });
}

std::vector<Invitation> SqliteMetadata::listInvitations()
{
    auto &db = *m_connection;
    return db.read([&] {
        std::vector<Invitation> invitations;
        Query rows = db.query(
            "SELECT id, number, uses, used, created, expires FROM invitations ORDER BY id");
        while (rows.next())
            invitations.push_back({rows.integer(0), rows.text(1), static_cast<int>(rows.integer(2)),
                                   static_cast<int>(rows.integer(3)), rows.integer(4),
                                   rows.integer(5)});
        return invitations;
    });
}

bool SqliteMetadata::removeInvitation(std::int64_t id)
{
    auto &db = *m_connection;
    return db.write(
        [&] { return db.query("DELETE FROM invitations WHERE id = ?", id).run() == 1; });
}

void SqliteMetadata::forgetInvitations(Seconds expired)
{
    auto &db = *m_connection;
    db.write([&] { db.query("DELETE FROM invitations WHERE expires <= ?", expired).run(); });
}

/// The same answer was lost on its way: the account that it was about gets another token.
bool SqliteMetadata::Connection::repeat(const Registration &registration)
{
    return query("UPDATE accounts SET token_hash = ? WHERE number = ? AND id IN"
                 " (SELECT r.account FROM redemptions r JOIN invitations i ON i.id = r.invitation"
                 " WHERE i.code_hash = ? AND r.key_hash = ?)",
                 Bytes{registration.tokenHash}, registration.number, Bytes{registration.codeHash},
                 Bytes{registration.keyHash})
               .run() == 1;
}

bool SqliteMetadata::Connection::makeOrRenew(const Registration &registration, bool renew)
{
    if (renew)
        return query("UPDATE accounts SET token_hash = ? WHERE number = ?",
                     Bytes{registration.tokenHash}, registration.number)
                   .run() == 1;
    return query("INSERT INTO accounts (number, name, token_hash, created) VALUES (?, '', ?, ?)"
                 " ON CONFLICT (number) DO NOTHING",
                 registration.number, Bytes{registration.tokenHash}, registration.now)
               .run() == 1;
}

RegisterResult SqliteMetadata::Connection::redeem(const Registration &registration)
{
    if (repeat(registration))
        return RegisterResult::registered;
    std::int64_t id = 0;
    std::string bound;
    {
        Query row = query("SELECT id, number, used < uses, expires FROM invitations"
                          " WHERE code_hash = ?",
                          Bytes{registration.codeHash});
        if (!row.next())
            return RegisterResult::codeUnknown;
        if (row.integer(2) == 0)
            return RegisterResult::codeUsedUp;
        if (row.integer(3) <= registration.now)
            return RegisterResult::codeExpired;
        id = row.integer(0);
        bound = row.text(1);
    }
    if (!bound.empty() && bound != registration.number)
        return RegisterResult::codeForOther;
    if (!makeOrRenew(registration, !bound.empty()))
        return bound.empty() ? RegisterResult::numberTaken : RegisterResult::codeUnknown;
    query("UPDATE invitations SET used = used + 1 WHERE id = ?", id).run();
    query("INSERT INTO redemptions (invitation, account, key_hash)"
          " SELECT ?, id, ? FROM accounts WHERE number = ?",
          id, Bytes{registration.keyHash}, registration.number)
        .run();
    return RegisterResult::registered;
}

RegisterResult SqliteMetadata::registerAccount(const Registration &registration)
{
    auto &db = *m_connection;
    return db.write([&] { return db.redeem(registration); });
}

} // namespace pelliko::server
