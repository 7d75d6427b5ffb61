#include "PrivateStore.h"

#include <cmath>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <limits>
#include <sqlite3.h>
#include <sys/resource.h>

namespace
{

using Values = pelliko::test::PrivateStore;

constexpr const char *kTime = "remote-share-settings-share_time_last";
constexpr const char *kSize = "remote-share-settings-share_total_size";
constexpr const char *kTokens = "remote-share-settings-share_noti_tokens";

std::string text(const char *key)
{
    char *value = nullptr;
    const int code = preference_get_string(key, &value);
    std::string copy = value ? value : "error " + std::to_string(code);
    free(value);
    return copy;
}

// What another run of an application prints.
std::string probe(const std::string &environment, const std::string &arguments)
{
    const std::string command = "env " + environment +
                                " " PELLIKO_BUILD_DIR "/tests/preference-probe " + arguments +
                                " 2>/dev/null";
    FILE *pipe = popen(command.c_str(), "r");
    char line[100] = "";
    const bool read = fgets(line, sizeof line, pipe) != nullptr;
    pclose(pipe);
    return read ? line : "(nothing)";
}

} // namespace

TEST_F(Values, DoublesComeBackExactly)
{
    for (const double value :
         {0.0, 0.1, 63867312345.0, 1e300, -5e-324, std::numeric_limits<double>::infinity(), 3.0}) {
        double read = 7.5;
        EXPECT_EQ(PREFERENCE_ERROR_NONE, preference_set_double(kTime, value));
        EXPECT_EQ(PREFERENCE_ERROR_NONE, preference_get_double(kTime, &read));
        EXPECT_EQ(value, read);
    }
    double read = 0;
    preference_set_double(kTime, std::nan(""));
    EXPECT_EQ(PREFERENCE_ERROR_NONE, preference_get_double(kTime, &read));
    EXPECT_TRUE(std::isnan(read));
}

TEST_F(Values, IntegersHave32Bits)
{
    for (const int value : {0, -1, INT32_MAX, INT32_MIN}) {
        int read = 7;
        preference_set_int(kSize, value);
        EXPECT_EQ(PREFERENCE_ERROR_NONE, preference_get_int(kSize, &read));
        EXPECT_EQ(value, read);
    }
}

TEST_F(Values, AnEmptyTextIsAValueAndNullIsNot)
{
    EXPECT_EQ(PREFERENCE_ERROR_NONE, preference_set_string(kTokens, ""));
    EXPECT_EQ("", text(kTokens));
    EXPECT_EQ(PREFERENCE_ERROR_INVALID_PARAMETER, preference_set_string(kTokens, nullptr));
    EXPECT_EQ("", text(kTokens));
    preference_set_string(kTokens, "4+0.000000+-1 \xc3\xa9 ' \xff");
    EXPECT_EQ("4+0.000000+-1 \xc3\xa9 ' \xff", text(kTokens));
}

TEST_F(Values, BooleansKeepTheirType)
{
    bool flag = false;
    int number = 7;
    preference_set_boolean("flag", true);
    EXPECT_EQ(PREFERENCE_ERROR_NONE, preference_get_boolean("flag", &flag));
    EXPECT_TRUE(flag);
    EXPECT_EQ(PREFERENCE_ERROR_INVALID_PARAMETER, preference_get_int("flag", &number));
    EXPECT_EQ(7, number);
}

TEST_F(Values, AnAbsentKeyIsToldApart)
{
    int number = 7;
    bool existing = true;
    EXPECT_EQ(-17825744, preference_get_int(kSize, &number));
    EXPECT_EQ(7, number);
    EXPECT_EQ("error -17825744", text(kTokens));
    EXPECT_EQ(PREFERENCE_ERROR_NONE, preference_is_existing(kSize, &existing));
    EXPECT_FALSE(existing);
    preference_set_int(kSize, 1);
    preference_is_existing(kSize, &existing);
    EXPECT_TRUE(existing);
}

// The day's total is created as a real number although it is read as an integer.
TEST_F(Values, AKeyOfAnotherTypeIsAnErrorUntilTheNextSetRepairsIt)
{
    int number = 7;
    preference_set_double(kSize, 0.0);
    EXPECT_EQ(PREFERENCE_ERROR_INVALID_PARAMETER, preference_get_int(kSize, &number));
    EXPECT_EQ(7, number);
    EXPECT_EQ(PREFERENCE_ERROR_NONE, preference_set_int(kSize, 8));
    EXPECT_EQ(PREFERENCE_ERROR_NONE, preference_get_int(kSize, &number));
    EXPECT_EQ(8, number);
    double real = 7.5;
    EXPECT_EQ(PREFERENCE_ERROR_INVALID_PARAMETER, preference_get_double(kSize, &real));
}

TEST_F(Values, AreRemovedOneByOneOrAllTogether)
{
    preference_set_int("a", 1);
    preference_set_int("b", 2);
    preference_set_int("c", 3);
    EXPECT_EQ(PREFERENCE_ERROR_NONE, preference_remove("a"));
    EXPECT_EQ(PREFERENCE_ERROR_NO_KEY, preference_remove("a"));
    EXPECT_EQ(PREFERENCE_ERROR_NONE, preference_remove_all());
    int number = 0;
    EXPECT_EQ(PREFERENCE_ERROR_NO_KEY, preference_get_int("b", &number));
    EXPECT_EQ(PREFERENCE_ERROR_NO_KEY, preference_get_int("c", &number));
}

TEST_F(Values, RefuseNothingness)
{
    EXPECT_EQ(PREFERENCE_ERROR_INVALID_PARAMETER, preference_set_int(nullptr, 1));
    EXPECT_EQ(PREFERENCE_ERROR_INVALID_PARAMETER, preference_set_int("", 1));
    EXPECT_EQ(PREFERENCE_ERROR_INVALID_PARAMETER, preference_get_int("a", nullptr));
    EXPECT_EQ(PREFERENCE_ERROR_INVALID_PARAMETER, preference_get_string("a", nullptr));
    EXPECT_EQ(PREFERENCE_ERROR_INVALID_PARAMETER, preference_get_boolean("a", nullptr));
    EXPECT_EQ(PREFERENCE_ERROR_INVALID_PARAMETER, preference_is_existing("a", nullptr));
    EXPECT_EQ(PREFERENCE_ERROR_INVALID_PARAMETER, preference_remove(nullptr));
    EXPECT_EQ(PREFERENCE_ERROR_INVALID_PARAMETER, preference_set_changed_cb("a", nullptr, nullptr));
    EXPECT_EQ(PREFERENCE_ERROR_INVALID_PARAMETER, preference_unset_changed_cb(nullptr));
}

TEST_F(Values, AreSeenByAnotherConnectionAsSoonAsTheSetReturned)
{
    preference_set_string(kTokens, "kept");
    const std::string file = fileOf("com.velmora.preference-test");
    sqlite3 *database = nullptr;
    ASSERT_EQ(SQLITE_OK, sqlite3_open_v2(file.c_str(), &database, SQLITE_OPEN_READONLY, nullptr));
    sqlite3_stmt *query = nullptr;
    sqlite3_prepare_v2(database, "SELECT type, value FROM preference WHERE key = ?", -1, &query,
                       nullptr);
    sqlite3_bind_text(query, 1, kTokens, -1, SQLITE_STATIC);
    EXPECT_EQ(SQLITE_ROW, sqlite3_step(query));
    EXPECT_EQ(2, sqlite3_column_int(query, 0));
    EXPECT_STREQ("kept", reinterpret_cast<const char *>(sqlite3_column_text(query, 1)));
    sqlite3_finalize(query);
    sqlite3_close(database);
}

TEST_F(Values, OutliveTheProcessAndBelongToOneApplication)
{
    EXPECT_EQ("0 5\n", probe("PELLIKO_APP_ID=com.velmora.one", "set size 5"));
    EXPECT_EQ("0 5\n", probe("PELLIKO_APP_ID=com.velmora.one", "get size"));
    EXPECT_EQ("-17825744 -1\n", probe("PELLIKO_APP_ID=com.velmora.two", "get size"));
}

TEST_F(Values, AStoreThatCannotBeOpenedIsAnInputOutputError)
{
    EXPECT_EQ("-5 5\n", probe("XDG_DATA_HOME=/dev/null", "set size 5"));
    EXPECT_EQ("-5 -1\n", probe("XDG_DATA_HOME=/dev/null", "get size"));
}

TEST_F(Values, AStoreThatRefusesWritesKeepsWhatItHas)
{
    ASSERT_EQ(PREFERENCE_ERROR_NONE, preference_set_int(kSize, 5));
    rlimit before{};
    getrlimit(RLIMIT_FSIZE, &before);
    const rlimit nothing = {1, before.rlim_max};
    const auto handler = signal(SIGXFSZ, SIG_IGN);
    setrlimit(RLIMIT_FSIZE, &nothing);
    EXPECT_EQ(PREFERENCE_ERROR_IO_ERROR, preference_set_int(kSize, 6));
    EXPECT_EQ(PREFERENCE_ERROR_IO_ERROR, preference_set_string(kTokens, "abc"));
    setrlimit(RLIMIT_FSIZE, &before);
    signal(SIGXFSZ, handler);
    int size = -1;
    EXPECT_EQ(PREFERENCE_ERROR_NONE, preference_get_int(kSize, &size));
    EXPECT_EQ(5, size);
    EXPECT_EQ(PREFERENCE_ERROR_NONE, preference_set_int(kSize, 6)) << "there is room again";
}

TEST_F(Values, ADamagedStoreIsKeptAsideAndAFreshOneBegins)
{
    const std::string damaged = fileOf("com.velmora.damaged");
    std::ofstream(damaged) << std::string(5000, 'x');
    EXPECT_EQ("0 5\n", probe("PELLIKO_APP_ID=com.velmora.damaged", "set size 5"));
    EXPECT_EQ("0 5\n", probe("PELLIKO_APP_ID=com.velmora.damaged", "get size"));
    EXPECT_EQ(5000U, std::filesystem::file_size(damaged + ".broken"));
}
