// Which database connection a call may use.
#pragma once

namespace SQLite
{
class Database;
}

namespace pelliko::contacts
{

/// The calling thread's own connection, opened on its first use, or null when neither the process
/// nor the thread is connected. It stays the thread's. Throws SQLite::Exception when the store does
/// not open.
SQLite::Database *threadDatabase();

} // namespace pelliko::contacts
