#pragma once

namespace pelliko::server
{

class PostgresConnection;

/// Brings the database's tables to the layout that this server knows; of several servers that start
/// at once one does it. Throws StorageFailure when a newer server has been here.
void migrate(PostgresConnection &db);

/// First half of the pairs of numbers that the servers' locks in the database have; the second
/// half tells what for. The rights to write blobs are single numbers, which are others.
inline constexpr int lockGroup = 0x50656c6b;
inline constexpr int lockOfLayout = 1;
inline constexpr int lockOfSweeper = 2;
/// Servers have it together; who needs the store without any has it alone.
inline constexpr int lockOfServing = 3;
inline constexpr int lockOfMoving = 4;

/// Where servers tell each other of what is in the tables: "push ACCOUNT…", "stop BLOB…", "sweep".
#define PELLIKO_CHANNEL "pelliko"

} // namespace pelliko::server
