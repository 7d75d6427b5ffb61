#pragma once

#include "store/PostgresConnection.h"

#include <cstdlib>
#include <string>
#include <vector>

namespace pelliko::server
{

/// The database that scripts/with-postgres gave; empty where there is none, and then nothing here
/// is a test.
inline std::string postgresUrl()
{
    const char *url = std::getenv("PELLIKO_POSTGRES");
    return url == nullptr ? std::string() : std::string(url);
}

inline std::vector<std::string> postgresUrls()
{
    return postgresUrl().empty() ? std::vector<std::string>{} : std::vector{postgresUrl()};
}

inline void emptyDatabase()
{
    PostgresConnection(postgresUrl()).command("DROP SCHEMA public CASCADE; CREATE SCHEMA public");
}

} // namespace pelliko::server
