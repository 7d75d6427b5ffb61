#include "Account.h"

#include "Fakes.h"

#include <sys/stat.h>

using namespace pelliko::service;

TEST(Account, isWrittenForTheUserAloneAndReadBack)
{
    Folder folder;
    const std::string file = folder.file("deep/account.json");
    ASSERT_EQ(writeAccount(file, {"https://share.example/", "+491", "secret"}), "");
    struct stat info {
    };
    ASSERT_EQ(stat(file.c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 0777, 0600U);
    const auto account = readAccount(file);
    ASSERT_TRUE(account);
    EXPECT_EQ(account->server, "https://share.example");
    EXPECT_EQ(account->number, "+491");
    EXPECT_EQ(account->token, "secret");
}

TEST(Account, theEnvironmentNamesAnotherServer)
{
    Folder folder;
    const std::string file = folder.file("account.json");
    ASSERT_EQ(writeAccount(file, {"https://one", "+491", "secret"}), "");
    setenv("PELLIKO_SERVER_URL", "http://127.0.0.1:9/", 1);
    const auto account = readAccount(file);
    unsetenv("PELLIKO_SERVER_URL");
    ASSERT_TRUE(account);
    EXPECT_EQ(account->server, "http://127.0.0.1:9");
}

TEST(Account, brokenOnesAreNoAccounts)
{
    Folder folder;
    EXPECT_FALSE(readAccount(folder.file("missing.json")));
    EXPECT_FALSE(readAccount(folder.make("a.json", "{")));
    EXPECT_FALSE(readAccount(folder.make("b.json", "[]")));
    EXPECT_FALSE(readAccount(folder.make("c.json", R"({"server":"http://x","number":"+1"})")));
    EXPECT_FALSE(
        readAccount(folder.make("d.json", R"({"server":"ftp://x","number":"1","token":"t"})")));
}

TEST(Account, aTokenCannotSmuggleAHeaderIn)
{
    EXPECT_NE(accountFault({"http://x", "+1", "token\r\nHost: evil"}), "");
    EXPECT_EQ(accountFault({"http://x", "+1", "token"}), "");
}
