#include "Account.h"

#include "Fakes.h"

using namespace pelliko::service;

TEST(UsableAccount, theEnvironmentNamesAnotherServer)
{
    Folder folder;
    const std::string file = folder.file("account.json");
    ASSERT_EQ(pelliko::korrin::writeAccount(file, {"https://one", "+491", "secret"}), "");
    setenv("PELLIKO_SERVER_URL", "http://127.0.0.1:9/", 1);
    const auto account = usableAccount(file);
    setenv("PELLIKO_SERVER_URL", "nonsense", 1);
    EXPECT_FALSE(usableAccount(file));
    unsetenv("PELLIKO_SERVER_URL");
    ASSERT_TRUE(account);
    EXPECT_EQ(account->server, "http://127.0.0.1:9");
    EXPECT_EQ(account->token, "secret");
}

TEST(UsableAccount, isWhatTheFileHoldsAtThatMoment)
{
    Folder folder;
    const std::string file = folder.file("account.json");
    EXPECT_FALSE(usableAccount(file));
    ASSERT_EQ(pelliko::korrin::writeAccount(file, {"https://one", "+491", "old"}), "");
    EXPECT_EQ(usableAccount(file)->token, "old");
    ASSERT_EQ(pelliko::korrin::writeAccount(file, {"https://one", "+491", "new"}), "");
    EXPECT_EQ(usableAccount(file)->token, "new");
    folder.make("account.json", "{");
    EXPECT_FALSE(usableAccount(file));
}
