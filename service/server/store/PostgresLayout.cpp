#include "store/PostgresLayout.h"

#include "store/PostgresConnection.h"

#include <array>
#include <string>

namespace pelliko::server
{
namespace
{

// Names are compared byte by byte: no language's order is wanted and none can change with a
// library.
constexpr const char *firstLayout = R"sql(
CREATE TABLE accounts (
  id bigint GENERATED ALWAYS AS IDENTITY PRIMARY KEY,
  number text COLLATE "C" NOT NULL UNIQUE,
  name text NOT NULL,
  token_hash bytea NOT NULL UNIQUE,
  created bigint NOT NULL,
  last_push bigint NOT NULL DEFAULT 0) WITH (fillfactor = 80);
CREATE TABLE shares (
  id bigint GENERATED ALWAYS AS IDENTITY PRIMARY KEY,
  key text COLLATE "C" NOT NULL UNIQUE,
  account bigint NOT NULL REFERENCES accounts (id) ON DELETE CASCADE,
  idempotency_key text COLLATE "C",
  state smallint NOT NULL,
  created bigint NOT NULL,
  deadline bigint NOT NULL,
  ended bigint,
  link_hash bytea UNIQUE,
  UNIQUE (account, idempotency_key));
CREATE INDEX shares_of_account ON shares (account, id);
CREATE INDEX shares_by_deadline ON shares (deadline) WHERE state IN (0, 1);
CREATE INDEX shares_by_end ON shares (ended) WHERE ended IS NOT NULL;
CREATE TABLE recipients (
  share bigint NOT NULL REFERENCES shares (id) ON DELETE CASCADE,
  position integer NOT NULL,
  number text NOT NULL,
  ccc text NOT NULL,
  PRIMARY KEY (share, position));
CREATE TABLE blobs (
  id bigint GENERATED ALWAYS AS IDENTITY PRIMARY KEY,
  key text COLLATE "C" NOT NULL UNIQUE,
  received bigint NOT NULL DEFAULT 0,
  doomed boolean NOT NULL DEFAULT false,
  writer bigint NOT NULL DEFAULT 0) WITH (fillfactor = 80);
CREATE INDEX blobs_doomed ON blobs (id) WHERE doomed;
CREATE TABLE files (
  share bigint NOT NULL REFERENCES shares (id) ON DELETE CASCADE,
  position integer NOT NULL,
  name text NOT NULL,
  type text NOT NULL,
  size bigint NOT NULL,
  upload text COLLATE "C" NOT NULL UNIQUE,
  blob bigint REFERENCES blobs (id),
  PRIMARY KEY (share, position));
CREATE INDEX files_by_blob ON files (blob);
CREATE TABLE usage (
  account bigint NOT NULL REFERENCES accounts (id) ON DELETE CASCADE,
  share bigint,
  at bigint NOT NULL,
  bytes bigint NOT NULL);
CREATE INDEX usage_of_account ON usage (account, at);
CREATE INDEX usage_by_share ON usage (share);
CREATE INDEX usage_by_time ON usage (at);
CREATE TABLE questions (
  account bigint NOT NULL REFERENCES accounts (id) ON DELETE CASCADE,
  at bigint NOT NULL,
  numbers bigint NOT NULL,
  PRIMARY KEY (account, at));
CREATE INDEX questions_by_time ON questions (at);
CREATE TABLE invitations (
  id bigint GENERATED ALWAYS AS IDENTITY PRIMARY KEY,
  code_hash bytea NOT NULL UNIQUE,
  number text NOT NULL,
  uses integer NOT NULL,
  used integer NOT NULL DEFAULT 0,
  created bigint NOT NULL,
  expires bigint NOT NULL);
CREATE TABLE redemptions (
  invitation bigint NOT NULL REFERENCES invitations (id) ON DELETE CASCADE,
  account bigint NOT NULL REFERENCES accounts (id) ON DELETE CASCADE,
  key_hash bytea NOT NULL,
  PRIMARY KEY (invitation, account, key_hash));
CREATE INDEX redemptions_by_account ON redemptions (account);
CREATE TABLE pushes (
  account bigint NOT NULL REFERENCES accounts (id) ON DELETE CASCADE,
  id bigint NOT NULL,
  share bigint NOT NULL REFERENCES shares (id) ON DELETE CASCADE,
  state smallint NOT NULL,
  token text,
  token_hash bytea NOT NULL UNIQUE,
  PRIMARY KEY (account, id),
  UNIQUE (share, account));
CREATE INDEX pushes_waiting ON pushes (account, id) WHERE state = 0;
CREATE SEQUENCE writers;
)sql";

/// The way from each version of the layout to the next; a fresh database goes all of it.
constexpr std::array layouts{firstLayout};

void takeLock(PostgresConnection &db)
{
    db.command("SET LOCAL lock_timeout = 0; SET LOCAL statement_timeout = 0;"
               "SET LOCAL idle_in_transaction_session_timeout = 0");
    db.query("SELECT pg_advisory_xact_lock($1::bigint::int, $2::bigint::int)", lockGroup,
             lockOfLayout);
}

void goAllTheWay(PostgresConnection &db)
{
    takeLock(db);
    db.command("CREATE TABLE IF NOT EXISTS layout (version bigint NOT NULL)");
    PostgresRows row = db.query("SELECT version FROM layout");
    const std::int64_t version = row.next() ? row.integer(0) : 0;
    const auto newest = static_cast<std::int64_t>(layouts.size());
    if (version > newest)
        throw StorageFailure(StorageFailure::Kind::broken,
                             "metadata: the database was made by a newer server");
    if (version == newest)
        return;
    for (auto step = static_cast<std::size_t>(version); step < layouts.size(); ++step)
        db.command(layouts.at(step));
    db.command("DELETE FROM layout");
    db.query("INSERT INTO layout (version) VALUES ($1)", newest);
}

} // namespace

void migrate(PostgresConnection &db)
{
    db.waitForever();
    db.command("BEGIN");
    goAllTheWay(db);
    db.command("COMMIT");
}

} // namespace pelliko::server
