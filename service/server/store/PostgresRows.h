// What the calls on PostgreSQL have in common
#pragma once

#include "store/PostgresPool.h"
#include "store/ShareRow.h"

#include <optional>
#include <string>
#include <vector>

namespace pelliko::server
{

/// Reads the files and recipients of all these shares.
void addParts(PostgresConnection &db, std::vector<ShareRow> &shares);
void addParts(PostgresConnection &db, ShareRow &share);

/// The account's share without its parts; with `lock` nobody else ends or finishes it before this
/// transaction does. Who locks shares and accounts locks shares first, or two would wait for each
/// other.
std::optional<ShareRow> findShareRow(PostgresConnection &db, std::int64_t account,
                                     const std::string &key, Seconds now, bool lock);

/// A share that is there, with its parts.
ShareRow shareById(PostgresConnection &db, std::int64_t id, Seconds now);

/// Makes the locked share end in `state` at `now`; returns the keys of the blobs it had.
std::vector<std::string> endShare(PostgresConnection &db, ShareRow &share, ShareState state,
                                  Seconds now);

/// From here on the account's limits are this transaction's to count.
void lockAccount(PostgresConnection &db, std::int64_t account);

/// Tells every server, this one included, when the transaction commits: a word and then numbers.
void tellServers(PostgresConnection &db, const std::string &word,
                 const std::vector<std::int64_t> &numbers);

} // namespace pelliko::server
