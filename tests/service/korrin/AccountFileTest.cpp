#include "kor_account.h"

#include "Folder.h"

#include <csignal>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

using namespace pelliko::korrin;
using Kind = AccountFinding::Kind;

namespace
{

const Account ann{"https://share.example/", "+491", "secret", "262011234567890"};

unsigned modeOf(const std::string &file)
{
    struct stat info {
    };
    EXPECT_EQ(stat(file.c_str(), &info), 0);
    return info.st_mode & 0777;
}

} // namespace

TEST(Account, isWrittenForTheUserAloneAndReadBack)
{
    Folder folder;
    const std::string file = folder.file("deep/account.json");
    umask(0);
    ASSERT_EQ(writeAccount(file, ann), "");
    EXPECT_EQ(modeOf(file), 0600U);
    const AccountFinding found = findAccount(file);
    ASSERT_EQ(found.kind, Kind::account);
    EXPECT_EQ(found.account.server, "https://share.example");
    EXPECT_EQ(found.account.number, "+491");
    EXPECT_EQ(found.account.token, "secret");
    EXPECT_EQ(found.account.imsi, "262011234567890");
}

TEST(Account, aFileThatOthersCouldReadIsPrivateOnceItIsReplaced)
{
    Folder folder;
    const std::string file = folder.make("account.json", "{}");
    chmod(file.c_str(), 0644);
    // A link that somebody laid where the draft goes must not be followed.
    const std::string elsewhere = folder.make("elsewhere", "untouched");
    std::filesystem::create_symlink(elsewhere, file + ".new");
    ASSERT_EQ(writeAccount(file, ann), "");
    EXPECT_EQ(modeOf(file), 0600U);
    EXPECT_EQ(readText(elsewhere), "untouched");
}

TEST(Account, noFileAndABrokenFileAreToldApart)
{
    Folder folder;
    EXPECT_EQ(findAccount(folder.file("missing.json")).kind, Kind::none);
    EXPECT_EQ(findAccount(folder.file("missing/account.json")).kind, Kind::none);
    EXPECT_EQ(findAccount(folder.make("a.json", "{")).kind, Kind::broken);
    EXPECT_EQ(findAccount(folder.make("b.json", "[]")).kind, Kind::broken);
    EXPECT_EQ(findAccount(folder.make("c.json", "")).kind, Kind::broken);
    EXPECT_EQ(findAccount(folder.make("d.json", R"({"server":"http://x","number":"+1"})")).kind,
              Kind::broken);
    EXPECT_EQ(
        findAccount(folder.make("e.json", R"({"server":"ftp://x","number":"1","token":"t"})")).kind,
        Kind::broken);
    EXPECT_EQ(findAccount(folder.path.string()).kind, Kind::broken);
}

TEST(Account, oneFromBeforeSimsWereNotedIsStillAnAccount)
{
    Folder folder;
    const auto old = folder.make("a.json", R"({"server":"http://x","number":"+1","token":"t"})");
    EXPECT_EQ(findAccount(old).kind, Kind::account);
    EXPECT_EQ(findAccount(old).account.imsi, "");
    const auto odd =
        folder.make("b.json", R"({"server":"http://x","number":"+1","token":"t","imsi":"26"})");
    EXPECT_EQ(findAccount(odd).account.imsi, "");
}

TEST(Account, thatCouldNotBeUsedIsNotWritten)
{
    Folder folder;
    const std::string file = folder.file("account.json");
    ASSERT_EQ(writeAccount(file, ann), "");
    const std::string before = readText(file);
    for (const Account &bad : {Account{"ftp://x", "+1", "t"}, Account{"http://x", "", "t"},
                               Account{"http://x", "+1", ""}, Account{"http://x", "+1", "t", "26"},
                               Account{"http://x", "+1", "token\r\nHost: evil"}})
        EXPECT_NE(writeAccount(file, bad), "") << bad.server;
    EXPECT_EQ(readText(file), before);
}

TEST(Account, aFullOrForbiddenDiskIsSaidAndKeepsTheOldOne)
{
    EXPECT_NE(writeAccount("/proc/pelliko/account.json", ann), "");
    Folder folder;
    const std::string file = folder.file("account.json");
    std::filesystem::create_directories(file);
    EXPECT_NE(writeAccount(file, ann), "");
    EXPECT_FALSE(std::filesystem::exists(file + ".new"));
}

TEST(Account, isGoneAfterSigningOut)
{
    Folder folder;
    const std::string file = folder.file("account.json");
    EXPECT_EQ(removeAccount(file), "");
    EXPECT_EQ(removeAccount(folder.file("missing/account.json")), "");
    ASSERT_EQ(writeAccount(file, ann), "");
    folder.make("account.json.new", "a draft with the token");
    EXPECT_EQ(removeAccount(file), "");
    EXPECT_TRUE(std::filesystem::is_empty(folder.path));
}

TEST(Account, addressesLoseTheirSlashesAndSpaces)
{
    EXPECT_EQ(plainServer("  https://one.example//\n"), "https://one.example");
    EXPECT_EQ(plainServer(" / "), "");
    EXPECT_EQ(plainServer(""), "");
}

namespace
{

// Writes two accounts in turn until it is killed.
[[noreturn]] void writeForEver(const std::string &file, int ready)
{
    const Account one{"https://one.example", "+491", std::string(4000, 'a')};
    const Account two{"https://two.example", "+492", std::string(4000, 'b')};
    for (bool told = false;; told = true) {
        if (!writeAccount(file, one).empty() || !writeAccount(file, two).empty())
            _exit(1);
        if (!told && write(ready, "x", 1) != 1)
            _exit(1);
    }
}

} // namespace

TEST(Account, aWriterThatIsKilledLeavesTheOldOneOrTheNewOne)
{
    Folder folder;
    const std::string file = folder.file("account.json");
    for (int round = 0; round < 20; ++round) {
        int ready[2];
        ASSERT_EQ(pipe(ready), 0);
        const pid_t child = fork();
        if (child == 0)
            writeForEver(file, ready[1]);
        char byte = 0;
        ASSERT_EQ(read(ready[0], &byte, 1), 1);
        // Some reads while it writes, a different number each round, so that the kills fall apart.
        for (int look = 0; look < round * 7; ++look)
            ASSERT_EQ(findAccount(file).kind, Kind::account) << readText(file);
        kill(child, SIGKILL);
        ASSERT_EQ(waitpid(child, nullptr, 0), child);
        const AccountFinding left = findAccount(file);
        ASSERT_EQ(left.kind, Kind::account) << left.reason;
        const bool one = left.account.number == "+491";
        EXPECT_EQ(left.account.server, one ? "https://one.example" : "https://two.example");
        EXPECT_EQ(left.account.token, std::string(4000, one ? 'a' : 'b'));
        close(ready[0]);
        close(ready[1]);
    }
    // The dead writers' lock is no hindrance.
    EXPECT_EQ(writeAccount(file, ann), "");
    EXPECT_EQ(removeAccount(file), "");
    EXPECT_TRUE(std::filesystem::is_empty(folder.path));
}

TEST(Account, twoWhoChangeItAtOnceLoseNothing)
{
    Folder folder;
    const std::string file = folder.file("account.json");
    ASSERT_EQ(writeAccount(file, {"http://x", "+", "t"}), "");
    constexpr int rounds = 50;
    const pid_t child = fork();
    for (int i = 0; i < rounds; ++i)
        changeAccount(file, [child](Account &account) {
            account.number += child == 0 ? "1" : "2";
            return true;
        });
    if (child == 0)
        _exit(0);
    ASSERT_EQ(waitpid(child, nullptr, 0), child);
    EXPECT_EQ(findAccount(file).account.number.size(), 1U + 2 * rounds);
}
