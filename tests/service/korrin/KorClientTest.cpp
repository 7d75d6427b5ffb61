#include "kor_account.h"
#include "kor_client.h"

#include "Folder.h"

#include <cstdlib>

using namespace pelliko::korrin;

namespace
{

/// A user's configuration of its own, and the client that looks at it.
class AccountClient : public testing::Test
{
protected:
    AccountClient()
    {
        // GLib asks for the directory once, so the tests of this program share one.
        EXPECT_EQ(kor_open_handle(&handle), KOR_ERROR_NONE);
        removeAccount(defaultAccountFile());
    }
    ~AccountClient() override { removeAccount(defaultAccountFile()); }

    static void write(const std::string &imsi)
    {
        ASSERT_EQ(writeAccount(defaultAccountFile(), {"http://x", "+4915112345678", "t", imsi}),
                  "");
    }

    kor_handle_h handle = nullptr;
    char *imsi = nullptr;
    int state = -1;
};

[[maybe_unused]] const bool ownConfiguration = [] {
    static Folder folder;
    setenv("XDG_CONFIG_HOME", folder.path.c_str(), 1);
    return true;
}();

} // namespace

TEST_F(AccountClient, nobodyHasSignedIn)
{
    char *untouched = strdup("before");
    imsi = untouched;
    EXPECT_EQ(kor_check_account_exist(handle, &imsi, &state), KOR_ERROR_NONE);
    EXPECT_EQ(imsi, nullptr);
    EXPECT_EQ(state, 0);
    free(untouched);
    EXPECT_EQ(kor_set_imsi(handle, "262011234567890"), KOR_ERROR_NO_ACCOUNT);
}

TEST_F(AccountClient, theAccountTellsItsSim)
{
    write("262011234567890");
    EXPECT_EQ(kor_check_account_exist(handle, &imsi, &state), KOR_ERROR_NONE);
    EXPECT_STREQ(imsi, "262011234567890");
    EXPECT_EQ(state, 1);
    free(imsi);
    EXPECT_EQ(kor_check_account_exist(handle, &imsi, nullptr), KOR_ERROR_NONE);
    free(imsi);
}

TEST_F(AccountClient, anAccountFromBeforeSimsWereNotedHasOneOfItsCountry)
{
    write("");
    EXPECT_EQ(kor_check_account_exist(handle, &imsi, &state), KOR_ERROR_NONE);
    EXPECT_STREQ(imsi, "262005112345678");
    EXPECT_EQ(state, 1);
    free(imsi);
}

TEST_F(AccountClient, aBrokenFileIsAnErrorAndChangesNothing)
{
    write("262011234567890");
    std::ofstream(defaultAccountFile()) << "{";
    EXPECT_EQ(kor_check_account_exist(handle, &imsi, &state), KOR_ERROR_IO_ERROR);
    EXPECT_EQ(imsi, nullptr);
    EXPECT_EQ(state, -1);
    EXPECT_EQ(kor_set_imsi(handle, "262011234567890"), KOR_ERROR_IO_ERROR);
    EXPECT_EQ(readText(defaultAccountFile()), "{");
}

TEST_F(AccountClient, anotherSimIsNotedAndTheSameOneWritesNothing)
{
    write("262011234567890");
    EXPECT_EQ(kor_set_imsi(handle, "234150999999999"), KOR_ERROR_NONE);
    const AccountFinding found = findAccount(defaultAccountFile());
    EXPECT_EQ(found.account.imsi, "234150999999999");
    EXPECT_EQ(found.account.token, "t");
    const auto written = std::filesystem::last_write_time(defaultAccountFile());
    std::filesystem::last_write_time(defaultAccountFile(), written - std::chrono::hours(1));
    EXPECT_EQ(kor_set_imsi(handle, "234150999999999"), KOR_ERROR_NONE);
    EXPECT_EQ(std::filesystem::last_write_time(defaultAccountFile()),
              written - std::chrono::hours(1));
}

TEST_F(AccountClient, whatIsNoSimIsRefused)
{
    write("262011234567890");
    for (const char *bad : {static_cast<const char *>(nullptr), "", "26", "26201",
                            "2620112345678901", "26201123456789x", " 26201123456789"})
        EXPECT_EQ(kor_set_imsi(handle, bad), KOR_ERROR_INVALID_PARAMETER) << (bad ? bad : "null");
    EXPECT_EQ(findAccount(defaultAccountFile()).account.imsi, "262011234567890");
}

TEST_F(AccountClient, nullArgumentsAreErrors)
{
    EXPECT_EQ(kor_open_handle(nullptr), KOR_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(kor_check_account_exist(nullptr, &imsi, &state), KOR_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(kor_check_account_exist(handle, nullptr, &state), KOR_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(kor_set_imsi(nullptr, "262011234567890"), KOR_ERROR_INVALID_PARAMETER);
}

TEST_F(AccountClient, openingTwiceGivesAHandleThatWorks)
{
    kor_handle_h second = nullptr;
    EXPECT_EQ(kor_open_handle(&second), KOR_ERROR_NONE);
    EXPECT_NE(second, handle);
    EXPECT_EQ(kor_check_account_exist(second, &imsi, &state), KOR_ERROR_NONE);
}
