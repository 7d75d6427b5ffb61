// The file that holds the contacts, and its tables.
#pragma once

#include <memory>
#include <string>

namespace SQLite
{
class Database;
}

namespace pelliko::contacts
{

/// Row ids of the two address books that every store has.
inline constexpr int device_book = 0;
inline constexpr int service_book = 1;

/// The sharing service's own address book; applications look it up by this name.
inline constexpr const char *service_book_name = "ZORP_Universal_Contact";

enum class Access { Read, Write };

/// Opens contacts.db in the state directory, making file and tables when they are not there yet,
/// and adds the SQL function fold(text). A connection is used by one thread at a time. Throws
/// SQLite::Exception; a store that a newer version made is refused.
std::unique_ptr<SQLite::Database> openDatabase(Access access);

/// The error number of the C interface for the exception in flight. Only inside a catch block.
int errorOfException() noexcept;

} // namespace pelliko::contacts
