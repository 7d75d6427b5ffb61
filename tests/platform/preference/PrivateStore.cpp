#include "PrivateStore.h"

#include <cstdlib>
#include <filesystem>

namespace pelliko::test
{

namespace
{

// One folder for the whole program: the store stays open between the cases.
class Folder : public testing::Environment
{
public:
    void SetUp() override
    {
        std::string pattern = testing::TempDir() + "preference-XXXXXX";
        path = mkdtemp(pattern.data());
        setenv("XDG_DATA_HOME", path.c_str(), 1);
    }
    void TearDown() override { std::filesystem::remove_all(path); }

    std::string path;
};

testing::Environment *const folder = testing::AddGlobalTestEnvironment(new Folder);

} // namespace

PrivateStore::PrivateStore()
{
    EXPECT_EQ(PREFERENCE_ERROR_NONE, preference_remove_all());
}

std::string PrivateStore::fileOf(const std::string &applicationId)
{
    return static_cast<Folder *>(folder)->path + "/pelliko-platform/preferences/" + applicationId +
           ".db";
}

} // namespace pelliko::test
