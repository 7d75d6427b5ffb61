#pragma once

#include <ApplicationId.h>
#include <StateDir.h>
#include <gtest/gtest.h>
#include <sqlite3.h>
#include <string>

namespace pelliko::test
{

/// While it lives, the application's preference store can be read but takes no value, as on a full
/// disk.
class RefusingStore
{
public:
    RefusingStore()
    {
        const std::string path =
            platform::stateDirectory() + "/preferences/" + platform::applicationId() + ".db";
        EXPECT_EQ(sqlite3_open_v2(path.c_str(), &store_, SQLITE_OPEN_READWRITE, nullptr),
                  SQLITE_OK);
        execute("CREATE TRIGGER refuse BEFORE INSERT ON preference "
                "BEGIN SELECT RAISE(ABORT, 'no room'); END;");
    }
    ~RefusingStore()
    {
        execute("DROP TRIGGER refuse;");
        sqlite3_close(store_);
    }
    RefusingStore(const RefusingStore &) = delete;
    RefusingStore &operator=(const RefusingStore &) = delete;

private:
    void execute(const char *statement)
    {
        EXPECT_EQ(sqlite3_exec(store_, statement, nullptr, nullptr, nullptr), SQLITE_OK)
            << sqlite3_errmsg(store_);
    }

    sqlite3 *store_ = nullptr;
};

} // namespace pelliko::test
