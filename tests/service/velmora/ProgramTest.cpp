#include "Scene.h"

#include <glib.h>
#include <gmock/gmock.h>

namespace pelliko::velmora::test
{
namespace
{
struct Finished {
    int status = -1;
    std::string output;
    std::string errors;
};

Finished velmoraLog(std::vector<std::string> words)
{
    words.insert(words.begin(), "velmora-log");
    std::vector<char *> argv;
    for (std::string &word : words) {
        argv.push_back(word.data());
    }
    argv.push_back(nullptr);
    Finished run;
    char *output = nullptr;
    char *errors = nullptr;
    int status = -1;
    if (g_spawn_sync(nullptr, argv.data(), nullptr, G_SPAWN_SEARCH_PATH, nullptr, nullptr, &output,
                     &errors, &status, nullptr)) {
        run = {WEXITSTATUS(status), output, errors};
    }
    g_free(output);
    g_free(errors);
    return run;
}

class UsageProgram : public testing::Test
{
protected:
    UsageProgram()
    {
        std::filesystem::remove_all(users.place().folder);
        EXPECT_EQ(users.setCollecting(true), 0);
        setenv("TZ", "Asia/Tokyo", 1);
    }

    const RecordLog users{RecordLogPlace::ofUser()};
    const std::string record = R"({"time":"2026-05-05T20:00:00Z","uri":"/log/x","app_id":"com.a",)"
                               R"("feature":"PK05","extra":"1_10"})";
};

TEST_F(UsageProgram, ShowPrintsARecordOnALineOfItsOwn)
{
    ASSERT_EQ(users.append(record + "\n"), 0);
    const Finished shown = velmoraLog({"show"});
    EXPECT_EQ(shown.status, 0);
    EXPECT_EQ(shown.output, "2026-05-06 05:00:00  PK05  1_10                  com.a\n");
    EXPECT_EQ(velmoraLog({"show", "--json"}).output, record + "\n");
}

TEST_F(UsageProgram, ShowLeavesOutWhatIsNoRecordAndSaysSo)
{
    ASSERT_EQ(users.append("{\"ti\n"), 0);
    ASSERT_EQ(users.append("[]\n"), 0);
    ASSERT_EQ(users.append("{\"feature\":7}\n"), 0);
    const Finished shown = velmoraLog({"show", "--json"});
    EXPECT_EQ(shown.status, 0);
    EXPECT_EQ(shown.output, "{\"feature\":7}\n");
    EXPECT_EQ(shown.errors, "velmora-log: lines that are no records were left out: 2\n");
    EXPECT_EQ(velmoraLog({"show"}).status, 0);
}

TEST_F(UsageProgram, OffLastsUntilOn)
{
    EXPECT_EQ(velmoraLog({"off"}).output, "collecting: off\n");
    EXPECT_EQ(users.append(record + "\n"), -EPERM);
    EXPECT_THAT(velmoraLog({"status"}).output, testing::HasSubstr("collecting: off\nrecords: 0\n"));
    EXPECT_EQ(velmoraLog({"on"}).output, "collecting: on\n");
    EXPECT_EQ(users.append(record + "\n"), 0);
    EXPECT_EQ(velmoraLog({"status"}).output,
              "collecting: on\nrecords: 1\nfile: " + users.file() + "\n");
}

TEST_F(UsageProgram, ClearTakesTheRecordsAway)
{
    ASSERT_EQ(users.append(record + "\n"), 0);
    EXPECT_EQ(velmoraLog({"clear"}).status, 0);
    EXPECT_EQ(velmoraLog({"show"}).output, "");
}

TEST_F(UsageProgram, WhatCannotBeReadIsSaid)
{
    std::filesystem::remove_all(users.place().folder);
    std::ofstream(users.place().folder) << "in the way";
    for (const char *command : {"show", "status", "clear"}) {
        const Finished run = velmoraLog({command});
        EXPECT_EQ(run.status, 1) << command;
        EXPECT_THAT(run.errors, testing::MatchesRegex("velmora-log: cannot .*: Not a directory\n"))
            << command;
    }
    std::filesystem::remove(users.place().folder);
}

TEST_F(UsageProgram, ItExplainsItself)
{
    const Finished help = velmoraLog({"--help"});
    EXPECT_EQ(help.status, 0);
    EXPECT_THAT(help.output, testing::HasSubstr("never leave the machine"));
    EXPECT_EQ(velmoraLog({}).status, 2);
    EXPECT_EQ(velmoraLog({"shout"}).status, 2);
    EXPECT_THAT(velmoraLog({"shout"}).errors, testing::HasSubstr("subcommand"));
}
} // namespace
} // namespace pelliko::velmora::test
