#include <StateDir.h>

#include <cstdlib>
#include <filesystem>
#include <sys/stat.h>

#include <gtest/gtest.h>

using namespace pelliko::platform;

namespace
{

class StateDir : public testing::Test
{
protected:
    StateDir()
    {
        std::string pattern = testing::TempDir() + "state-XXXXXX";
        folder_ = mkdtemp(pattern.data());
        setenv("HOME", folder_.c_str(), 1);
        unsetenv("XDG_DATA_HOME");
        unsetenv("XDG_RUNTIME_DIR");
    }
    ~StateDir() override { std::filesystem::remove_all(folder_); }

    std::string folder_;
};

unsigned modeOf(const std::string &path)
{
    struct stat status = {};
    return stat(path.c_str(), &status) == 0 ? status.st_mode & 0777U : 0U;
}

} // namespace

TEST_F(StateDir, LiesUnderTheDataHomeForTheUserAlone)
{
    setenv("XDG_DATA_HOME", (folder_ + "/deep/data").c_str(), 1);
    EXPECT_EQ(folder_ + "/deep/data/pelliko-platform", stateDirectory());
    EXPECT_EQ(0700U, modeOf(stateDirectory()));
}

TEST_F(StateDir, DefaultsToTheHomeFolder)
{
    EXPECT_EQ(folder_ + "/.local/share/pelliko-platform", stateDirectory());
    EXPECT_TRUE(std::filesystem::is_directory(stateDirectory()));
}

TEST_F(StateDir, RunTimeFilesHaveTheirOwnPlace)
{
    EXPECT_EQ(folder_ + "/.local/share/pelliko-platform/run", runtimeDirectory());
    setenv("XDG_RUNTIME_DIR", folder_.c_str(), 1);
    EXPECT_EQ(folder_ + "/pelliko-platform", runtimeDirectory());
    EXPECT_EQ(0700U, modeOf(runtimeDirectory()));
}

TEST_F(StateDir, AFileInTheWayIsNoFolder)
{
    const std::string file = folder_ + "/file";
    fclose(fopen(file.c_str(), "w"));
    EXPECT_FALSE(createPrivateDirectories(file));
    EXPECT_FALSE(createPrivateDirectories(file + "/below"));
    EXPECT_TRUE(createPrivateDirectories(folder_ + "/a/b/c"));
    EXPECT_TRUE(createPrivateDirectories(folder_ + "/a/b/c"));
}
