#include "BlobsSuite.h"
#include "MetadataSuite.h"
#include "store/DirectoryBlobs.h"
#include "store/SqliteMetadata.h"
#include "store/StorageFailure.h"

#include <SQLiteCpp/SQLiteCpp.h>
#include <sys/resource.h>
#include <unistd.h>

#include <csignal>
#include <filesystem>
#include <fstream>

namespace pelliko::server
{
namespace
{

namespace fs = std::filesystem;

/// A directory that is emptied for each fresh store and removed at the end of the program.
class Scratch
{
public:
    Scratch() : m_path(fs::temp_directory_path() / ("pelliko-stores-" + std::to_string(getpid())))
    {
    }
    ~Scratch() { fs::remove_all(m_path); }

    const fs::path &fresh()
    {
        fs::remove_all(m_path);
        fs::create_directories(m_path);
        return m_path;
    }
    const fs::path &path() const { return m_path; }

private:
    fs::path m_path;
};

Scratch &scratch()
{
    static Scratch instance;
    return instance;
}

fs::path database()
{
    return scratch().path() / "metadata.db";
}

const MetadataMaker sqlite{"Sqlite",
                           [] {
                               scratch().fresh();
                               return std::make_unique<SqliteMetadata>(database());
                           },
                           [] { return std::make_unique<SqliteMetadata>(database()); }};

const BlobsMaker directory{
    "Directory", [] { return std::make_unique<DirectoryBlobs>(scratch().fresh() / "blobs"); },
    [] { return std::make_unique<DirectoryBlobs>(scratch().path() / "blobs"); }};

template <class Maker> std::string nameOf(const testing::TestParamInfo<Maker> &info)
{
    return info.param.name;
}

INSTANTIATE_TEST_SUITE_P(Metadata, MetadataSuite, testing::Values(sqlite), nameOf<MetadataMaker>);
INSTANTIATE_TEST_SUITE_P(Blobs, BlobsSuite, testing::Values(directory), nameOf<BlobsMaker>);

TEST(SqliteMetadata, AFileThatIsNoDatabaseIsAFailure)
{
    scratch().fresh();
    std::ofstream(database()) << std::string(4096, 'x');
    EXPECT_THROW(SqliteMetadata{database()}, StorageFailure);
}

TEST(SqliteMetadata, AFileOfTheFirstLayoutIsTakenOver)
{
    scratch().fresh();
    const std::string token(32, 'x');
    std::string key;
    {
        SqliteMetadata metadata(database());
        metadata.addAccount("+491", "Anna", token, 900);
        NewShare share;
        share.account = metadata.findAccount(token)->id;
        share.files = {{"a", "", 1}};
        share.now = 1000;
        share.deadline = 1500;
        share.dailyLimit = 2000;
        key = metadata.createShare(share).share.key;
        metadata.withdrawShare(share.account, key, 1100);
    }
    SQLite::Database(database().string(), SQLite::OPEN_READWRITE)
        .exec("DROP TABLE pushes; ALTER TABLE accounts DROP COLUMN last_push;"
              "DROP TABLE redemptions; DROP TABLE invitations; DROP TABLE questions;"
              "DROP INDEX shares_by_end; ALTER TABLE shares DROP COLUMN ended;"
              "PRAGMA user_version = 1");
    SqliteMetadata metadata(database());
    EXPECT_EQ(metadata.earliestEnd(), 1500);
    const auto account = metadata.findAccount(token)->id;
    EXPECT_EQ(metadata.askJoined({account, {"+491"}, 1500, 1}).joined,
              std::vector<std::string>{"+491"});
    EXPECT_EQ(metadata.findShare(account, key, 1500)->state, ShareState::withdrawn);
    metadata.addInvitation({std::string(32, 'c'), "+491", 1, 1000, 2000});
    EXPECT_EQ(
        metadata.registerAccount({std::string(32, 'c'), "+491", std::string(32, 'n'), "k", 1500}),
        RegisterResult::registered);
    EXPECT_FALSE(metadata.acknowledgePushes(account, 1));
    EXPECT_TRUE(metadata.waitingPushes(std::string(32, 'n'), 0, 1500)->empty());
    EXPECT_TRUE(metadata.listReceived(account, 1500).empty());
}

TEST(DirectoryBlobs, AFullStoreIsToldFromABrokenOne)
{
    DirectoryBlobs blobs(scratch().fresh() / "blobs");
    const auto writer = blobs.openForWriting("AAAAAAAAAAAAAAAAAAAAAA");
    rlimit before{};
    getrlimit(RLIMIT_FSIZE, &before);
    rlimit small = before;
    small.rlim_cur = 4096;
    std::signal(SIGXFSZ, SIG_IGN);
    setrlimit(RLIMIT_FSIZE, &small);
    StorageFailure::Kind kind = StorageFailure::Kind::broken;
    try {
        writer->write(0, std::string(8192, 'x'));
    } catch (const StorageFailure &failure) {
        kind = failure.kind();
    }
    setrlimit(RLIMIT_FSIZE, &before);
    EXPECT_EQ(kind, StorageFailure::Kind::full);
}

} // namespace
} // namespace pelliko::server
