// What the tests of the usage log share.
#pragma once

#include <RecordLog.h>

#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

namespace pelliko::velmora::test
{

/// A log in a folder of its own, which goes with the test.
class OwnLog : public testing::Test
{
protected:
    OwnLog()
    {
        char pattern[] = "/tmp/velmora-XXXXXX";
        home = mkdtemp(pattern);
        place.folder = home / "state" / "velmora";
        place.switchFile = home / "config" / "velmora" / "usage-log-off";
    }
    ~OwnLog() override { std::filesystem::remove_all(home); }

    RecordLog log() const { return RecordLog(place); }

    std::filesystem::path file(const char *name = "usage.jsonl") const
    {
        return std::filesystem::path(place.folder) / name;
    }

    /// What the log gives back.
    std::vector<std::string> lines() const
    {
        std::vector<std::string> all;
        EXPECT_EQ(log().read(all), 0);
        return all;
    }

    std::filesystem::path home;
    RecordLogPlace place;
};

/// Starts a child that runs the checks and ends.
template <typename Checks> pid_t startChild(const Checks &checks)
{
    fflush(nullptr);
    const pid_t child = fork();
    if (child == 0) {
        checks();
        fflush(nullptr);
        _exit(testing::Test::HasFailure() ? 1 : 0);
    }
    return child;
}

/// Whether the child's checks held.
inline bool succeeded(pid_t child)
{
    int status = -1;
    return child > 0 && waitpid(child, &status, 0) == child && WIFEXITED(status) &&
           WEXITSTATUS(status) == 0;
}

} // namespace pelliko::velmora::test
