#include "AppLog/AppLog.h"
#include "support/FileLog.h"
#include "support/FreshProcess.h"

#include <barrier>
#include <clocale>
#include <cstdlib>
#include <dlfcn.h>
#include <filesystem>
#include <future>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <regex>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <thread>

namespace
{
bool calendarFails = false;
} // namespace

// No clock of a test can show a time that has no calendar date.
extern "C" struct tm *localtime_r(const time_t *time, struct tm *result) noexcept
{
    using Function = struct tm *(*)(const time_t *, struct tm *);
    static const auto real = reinterpret_cast<Function>(dlsym(RTLD_NEXT, "localtime_r"));
    return calendarFails ? nullptr : real(time, result);
}

namespace pelliko
{
namespace
{

namespace fs = std::filesystem;
using test::FileLog;
using test::holdsInFreshProcess;
using ::testing::ElementsAre;
using ::testing::HasSubstr;

constexpr uintmax_t rotationSize = 5242880;
constexpr const char *tag = "PELLIKO:MESSAGE";

std::string archive(int number)
{
    return std::string(test::logPath) + "." + std::to_string(number) + ".tar.gz";
}

void write(const std::string &text)
{
    appLogWrite("AppLogTest.cpp", "write", 1, tag, "%s", text.c_str());
}

std::string textIn(const std::string &archive_path)
{
    std::string text; // holds the zeros that fill the file too
    FILE *tar = popen(("tar -xzOf " + archive_path + " app.log | tail -c 200").c_str(), "r");
    char buffer[256];
    text.assign(buffer, fread(buffer, 1, sizeof(buffer), tar));
    pclose(tar);
    return text;
}

// The bytes that one line with an empty message takes in this process.
uintmax_t emptyLineLength()
{
    const uintmax_t before = fs::file_size(test::logPath);
    write("");
    return fs::file_size(test::logPath) - before;
}

void rotateWith(const std::string &mark)
{
    fs::resize_file(test::logPath, rotationSize - 1);
    write(mark);
}

class AppLog : public ::testing::Test
{
protected:
    // The module counts its archives per process: each case has a directory and a process of its
    // own.
    void SetUp() override
    {
        fs::remove_all(test::logDirectory);
        fs::create_directories(test::logDirectory);
    }
    void TearDown() override
    {
        fs::remove_all(test::logDirectory);
        fs::create_directories(test::logDirectory);
    }
};

TEST_F(AppLog, LineHasTimeThreadTagAndPlace)
{
    EXPECT_TRUE(holdsInFreshProcess([] {
        const FileLog log;
        appLogWrite("Some.cpp", "someFunction", 42, tag, "count = %d", 7);
        ASSERT_EQ(log.lines().size(), 1u);
        const std::regex form("(\\d{4})-(\\d{2})-(\\d{2}) (\\d{2}):(\\d{2}):(\\d{2}) \\((\\d+)\\) "
                              "\\[PELLIKO:MESSAGE\\] Some\\.cpp: someFunction\\(42\\) > count = 7");
        std::smatch parts;
        const std::string line = log.lines()[0];
        ASSERT_TRUE(std::regex_match(line, parts, form)) << line;
        EXPECT_EQ(parts[7].str(), std::to_string(syscall(SYS_gettid)));
        const time_t now = time(nullptr);
        struct tm local;
        localtime_r(&now, &local);
        EXPECT_EQ(parts[1].str(), std::to_string(local.tm_year + 1900));
    }));
}

TEST_F(AppLog, LineWithoutATimeSaysSo)
{
    EXPECT_TRUE(holdsInFreshProcess([] {
        const FileLog log;
        calendarFails = true;
        appLogWrite("Some.cpp", "someFunction", 42, tag, "count = %d", 7);
        EXPECT_THAT(log.lines(),
                    ElementsAre("GET TIME ERROR (" + std::to_string(syscall(SYS_gettid)) +
                                ") [PELLIKO:MESSAGE] Some.cpp: someFunction(42) > count = 7"));
    }));
}

TEST_F(AppLog, PercentInAMessageIsNotFormattedAgain)
{
    EXPECT_TRUE(holdsInFreshProcess([] {
        const FileLog log;
        write("100%d of %s %n");
        EXPECT_THAT(log.messages(), ElementsAre("100%d of %s %n"));
    }));
}

TEST_F(AppLog, MacrosWriteTheMessageWithTheCallersPlace)
{
    EXPECT_TRUE(holdsInFreshProcess([] {
        const FileLog log;
        LOG_DEBUG("one %d", 1);
        LOG_ERROR("two");
        ASSERT_EQ(log.lines().size(), 2u);
        EXPECT_THAT(log.lines()[0], HasSubstr("AppLogTest.cpp: operator()("));
        EXPECT_THAT(log.messages(), ElementsAre("one 1", "two"));
    }));
}

std::string halfInThisLanguage()
{
    char text[16];
    snprintf(text, sizeof(text), "%.1f", 0.5);
    return text;
}

TEST_F(AppLog, NumbersHaveAPointInEveryLanguage)
{
    EXPECT_TRUE(holdsInFreshProcess([] {
        ASSERT_NE(setlocale(LC_ALL, "de_DE.UTF-8"), nullptr);
        ASSERT_EQ(halfInThisLanguage(), "0,5");
        const FileLog log;
        LOG_DEBUG("percent = %f", 45.5);
        appLogWrite("AppLogTest.cpp", "write", 1, tag, "part = %.2f", 0.25);
        EXPECT_THAT(log.messages(), ElementsAre("percent = 45.500000", "part = 0.25"));
        EXPECT_EQ(halfInThisLanguage(), "0,5");
    }));
}

TEST_F(AppLog, MessagesGoToThePlatformLogWithErrorsMarked)
{
    EXPECT_TRUE(holdsInFreshProcess([] {
        setenv("PELLIKO_LOG_STDERR", "1", 1);
        ::testing::internal::CaptureStderr();
        const std::string line = std::to_string(__LINE__ + 1);
        LOG_DEBUG("one %d", 1), LOG_ERROR("two");
        const std::string place = "(" + std::to_string(getpid()) + "): AppLogTest.cpp: operator()(";
        EXPECT_EQ(::testing::internal::GetCapturedStderr(), "D/PELLIKO" + place + line +
                                                                ") > one 1\n" + "E/PELLIKO" +
                                                                place + line + ") > [ERROR]two\n");
    }));
}

int checkedNull(const char *data)
{
    RETURN_VALUE_IF_NULL(data, -1, "data is NULL");
    return 0;
}

void checkedCount(int count)
{
    RETURN_IF(count % 2 == 1, "count %d is odd", count);
    LOG_DEBUG("count is good");
}

TEST_F(AppLog, ChecksNameTheConditionAndTheResult)
{
    EXPECT_TRUE(holdsInFreshProcess([] {
        const FileLog log;
        EXPECT_EQ(checkedNull(nullptr), -1);
        EXPECT_EQ(checkedNull("x"), 0);
        checkedCount(3);
        checkedCount(2);
        EXPECT_THAT(log.messages(),
                    ElementsAre("[ERROR][(data == NULL)] Return value : -1, message : data is NULL",
                                "[ERROR][(count % 2 == 1)] Return message : count 3 is odd",
                                "count is good"));
    }));
}

TEST_F(AppLog, LineThatFillsTheFileRotatesAtOnce)
{
    EXPECT_TRUE(holdsInFreshProcess([] {
        write("x");
        const uintmax_t line = emptyLineLength();
        fs::resize_file(test::logPath, rotationSize - 1 - line);
        write("");
        EXPECT_EQ(fs::file_size(test::logPath), rotationSize - 1);
        EXPECT_FALSE(fs::exists(archive(1)));

        fs::resize_file(test::logPath, rotationSize - line);
        write("");
        EXPECT_EQ(fs::file_size(test::logPath), 0u);
        EXPECT_TRUE(fs::exists(archive(1)));
        const FileLog log;
        write("first of the fresh file");
        EXPECT_THAT(log.messages(), ElementsAre("first of the fresh file"));
        EXPECT_LT(fs::file_size(test::logPath), 200u);
    }));
}

TEST_F(AppLog, SevenRotationsLeaveTheFiveNewestArchives)
{
    EXPECT_TRUE(holdsInFreshProcess([] {
        write("x");
        for (int i = 1; i <= 7; ++i)
            rotateWith("mark " + std::to_string(i));
        EXPECT_FALSE(fs::exists(archive(6)));
        for (int i = 1; i <= 5; ++i)
            EXPECT_THAT(textIn(archive(i)), HasSubstr("mark " + std::to_string(8 - i)));
    }));
}

TEST_F(AppLog, NewProcessOverwritesTheNewestArchiveFirst)
{
    EXPECT_TRUE(holdsInFreshProcess([] {
        write("x");
        rotateWith("old process");
    }));
    EXPECT_TRUE(holdsInFreshProcess([] {
        write("x");
        rotateWith("new process, first");
        EXPECT_FALSE(fs::exists(archive(2)));
        EXPECT_THAT(textIn(archive(1)), HasSubstr("new process, first"));
        rotateWith("new process, second");
        EXPECT_THAT(textIn(archive(2)), HasSubstr("new process, first"));
    }));
}

TEST_F(AppLog, OnlyFilesNamedAppCountAtTheStartAlsoInSubfolders)
{
    fs::create_directory(std::string(test::logDirectory) + "/deep");
    std::ofstream(std::string(test::logDirectory) + "/deep/app");
    std::ofstream(std::string(test::logDirectory) + "/apple");
    std::ofstream(archive(1)) << "old one";
    std::ofstream(archive(2)) << "old two";
    EXPECT_TRUE(holdsInFreshProcess([] {
        write("x");
        rotateWith("mark");
        // One was counted, so archive 1 moved over archive 2 and nothing moved to 3.
        std::string text;
        std::ifstream(archive(2)) >> text >> text;
        EXPECT_EQ(text, "one");
        EXPECT_FALSE(fs::exists(archive(3)));
    }));
}

TEST_F(AppLog, WithoutTarTheFileIsEmptiedAndTheRotationCounted)
{
    std::ofstream(archive(1)) << "stale";
    EXPECT_TRUE(holdsInFreshProcess([] {
        const std::string path = getenv("PATH");
        write("x");
        setenv("PATH", "/nowhere", 1);
        rotateWith("lost");
        setenv("PATH", path.c_str(), 1);
        EXPECT_EQ(fs::file_size(test::logPath), 0u);
        EXPECT_FALSE(fs::exists(archive(2)));
        write("x");
        rotateWith("kept");
        std::string text;
        std::ifstream(archive(2)) >> text;
        EXPECT_EQ(text, "stale");
        EXPECT_THAT(textIn(archive(1)), HasSubstr("kept"));
    }));
}

TEST_F(AppLog, WithoutADirectoryNothingIsCreatedUntilItIsThere)
{
    fs::remove_all(test::logDirectory);
    EXPECT_TRUE(holdsInFreshProcess([] {
        write("lost");
        EXPECT_FALSE(fs::exists(test::logDirectory));
        fs::create_directory(test::logDirectory);
        const FileLog log;
        write("kept");
        EXPECT_THAT(log.messages(), ElementsAre("kept"));
    }));
}

// A tar that tells when it was started and goes on when it is let: "started" and "go" are pipes.
void installSlowTar(const std::string &folder)
{
    fs::create_directory(folder);
    mkfifo((folder + "/started").c_str(), 0600);
    mkfifo((folder + "/go").c_str(), 0600);
    std::ofstream(folder + "/tar")
        << "#!/bin/sh\necho yes >" << folder << "/started\nread go <" << folder << "/go\n";
    fs::permissions(folder + "/tar", fs::perms::owner_all);
    setenv("PATH", (folder + ":" + getenv("PATH")).c_str(), 1);
}

TEST_F(AppLog, LineDuringARotationWaitsForItAndIsNotEmptiedAway)
{
    EXPECT_TRUE(holdsInFreshProcess([] {
        const std::string folder = "/tmp/slow-tar";
        installSlowTar(folder);
        write("x");
        std::thread rotating([] { rotateWith("mark"); });
        std::string word;
        std::ifstream(folder + "/started") >> word;

        std::future<void> second = std::async(std::launch::async, [] { write("second"); });
        EXPECT_EQ(second.wait_for(std::chrono::milliseconds(200)), std::future_status::timeout);
        std::ofstream(folder + "/go") << "go\n";
        rotating.join();
        second.get();
        std::ifstream log(test::logPath);
        const std::string kept(std::istreambuf_iterator<char>(log), {});
        EXPECT_THAT(kept, ::testing::EndsWith("> second\n"));
    }));
    fs::remove_all("/tmp/slow-tar");
}

TEST_F(AppLog, LinesOfManyThreadsNeverMix)
{
    EXPECT_TRUE(holdsInFreshProcess([] {
        constexpr int threads = 8;
        constexpr int lines = 50;
        constexpr size_t lineLength = 6000; // more than one write of a buffer
        const FileLog log;
        std::vector<std::thread> writers;
        for (int i = 0; i < threads; ++i)
            writers.emplace_back([i] {
                for (int j = 0; j < lines; ++j)
                    write(std::string(lineLength, static_cast<char>('a' + i)));
            });
        for (std::thread &writer : writers)
            writer.join();
        const std::vector<std::string> messages = log.messages();
        EXPECT_EQ(messages.size(), size_t{threads * lines});
        for (const std::string &message : messages)
            ASSERT_EQ(message, std::string(lineLength, message.at(0)));
    }));
}

TEST_F(AppLog, ThreadsThatFillTheFileTogetherRotateItOnce)
{
    EXPECT_TRUE(holdsInFreshProcess([] {
        constexpr int threads = 4;
        constexpr uintmax_t rounds = 25;
        const std::string folder = "/tmp/counting-tar";
        fs::create_directory(folder);
        std::ofstream(folder + "/tar") << "#!/bin/sh\nprintf x >>" << folder << "/runs\n";
        fs::permissions(folder + "/tar", fs::perms::owner_all);
        setenv("PATH", (folder + ":" + getenv("PATH")).c_str(), 1);
        write("x");
        for (uintmax_t round = 1; round <= rounds; ++round) {
            fs::resize_file(test::logPath, rotationSize - 1);
            std::barrier together(threads);
            std::vector<std::jthread> writers;
            for (int i = 0; i < threads; ++i)
                writers.emplace_back([&together] {
                    together.arrive_and_wait();
                    write("full");
                });
            writers.clear();
            ASSERT_EQ(fs::file_size(folder + "/runs"), round);
        }
    }));
    fs::remove_all("/tmp/counting-tar");
}

} // namespace
} // namespace pelliko
