#include "store/PostgresMetadata.h"
#include "store/PostgresRows.h"

namespace pelliko::server
{
namespace
{

/// The same answer was lost on its way: the account that it was about gets another token.
bool repeat(PostgresConnection &db, const Registration &registration)
{
    return db.query("UPDATE accounts SET token_hash = $1 WHERE number = $2 AND id IN"
                    " (SELECT r.account FROM redemptions r JOIN invitations i"
                    " ON i.id = r.invitation WHERE i.code_hash = $3 AND r.key_hash = $4)",
                    Bytes{registration.tokenHash}, registration.number,
                    Bytes{registration.codeHash}, Bytes{registration.keyHash})
               .changed() == 1;
}

bool makeOrRenew(PostgresConnection &db, const Registration &registration, bool renew)
{
    if (renew)
        return db.query("UPDATE accounts SET token_hash = $1 WHERE number = $2",
                        Bytes{registration.tokenHash}, registration.number)
                   .changed() == 1;
    return db.query("INSERT INTO accounts (number, name, token_hash, created)"
                    " VALUES ($1, '', $2, $3) ON CONFLICT (number) DO NOTHING",
                    registration.number, Bytes{registration.tokenHash}, registration.now)
               .changed() == 1;
}

RegisterResult redeem(PostgresConnection &db, const Registration &registration)
{
    // Whoever else has the code waits until this use is counted.
    PostgresRows row = db.query("SELECT id, number, used < uses, expires FROM invitations"
                                " WHERE code_hash = $1 FOR NO KEY UPDATE",
                                Bytes{registration.codeHash});
    if (!row.next())
        return RegisterResult::codeUnknown;
    if (repeat(db, registration))
        return RegisterResult::registered;
    if (row.integer(2) == 0)
        return RegisterResult::codeUsedUp;
    if (row.integer(3) <= registration.now)
        return RegisterResult::codeExpired;
    const std::int64_t id = row.integer(0);
    const std::string bound = row.text(1);
    if (!bound.empty() && bound != registration.number)
        return RegisterResult::codeForOther;
    if (!makeOrRenew(db, registration, !bound.empty()))
        return bound.empty() ? RegisterResult::numberTaken : RegisterResult::codeUnknown;
    db.query("UPDATE invitations SET used = used + 1 WHERE id = $1", id);
    db.query("INSERT INTO redemptions (invitation, account, key_hash)"
             " SELECT $1, id, $2 FROM accounts WHERE number = $3",
             id, Bytes{registration.keyHash}, registration.number);
    return RegisterResult::registered;
}

/// The phone that had the account before may listen at any server.
void endFormerStreams(PostgresConnection &db, const std::string &number)
{
    PostgresRows row = db.query("SELECT id FROM accounts WHERE number = $1", number);
    if (row.next())
        tellServers(db, "push", {row.integer(0)});
}

} // namespace

void PostgresMetadata::addInvitation(const NewInvitation &invitation)
{
    m_pool->write([&](PostgresConnection &db) {
        db.query("INSERT INTO invitations (code_hash, number, uses, created, expires)"
                 " VALUES ($1, $2, $3, $4, $5)",
                 Bytes{invitation.codeHash}, invitation.number, invitation.uses, invitation.now,
                 invitation.expires);
    });
}

std::vector<Invitation> PostgresMetadata::listInvitations()
{
    return m_pool->single([](PostgresConnection &db) {
        std::vector<Invitation> invitations;
        PostgresRows rows = db.query(
            "SELECT id, number, uses, used, created, expires FROM invitations ORDER BY id");
        while (rows.next())
            invitations.push_back({rows.integer(0), rows.text(1), static_cast<int>(rows.integer(2)),
                                   static_cast<int>(rows.integer(3)), rows.integer(4),
                                   rows.integer(5)});
        return invitations;
    });
}

bool PostgresMetadata::removeInvitation(std::int64_t id)
{
    return m_pool->write([&](PostgresConnection &db) {
        return db.query("DELETE FROM invitations WHERE id = $1", id).changed() == 1;
    });
}

void PostgresMetadata::forgetInvitations(Seconds expired)
{
    m_pool->single([&](PostgresConnection &db) {
        db.query("DELETE FROM invitations WHERE expires <= $1", expired);
    });
}

RegisterResult PostgresMetadata::registerAccount(const Registration &registration)
{
    return m_pool->write([&](PostgresConnection &db) {
        const RegisterResult result = redeem(db, registration);
        if (result == RegisterResult::registered)
            endFormerStreams(db, registration.number);
        return result;
    });
}

} // namespace pelliko::server
