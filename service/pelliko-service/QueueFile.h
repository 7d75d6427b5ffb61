// The file of the queue and of the journals beside it
#pragma once

#include <memory>
#include <string>

namespace SQLite
{
class Database;
}

namespace pelliko::service
{

/**
 * Opens the queue's file, made or brought to the present layout when it is not. A damaged one is
 * kept beside it with ".broken" behind its name, and a fresh one begins, whose ids are higher.
 * Throws when there is no way to a usable file; waits while another program holds it locked.
 */
std::unique_ptr<SQLite::Database> openQueueFile(const std::string &file);

} // namespace pelliko::service
