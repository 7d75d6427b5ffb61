#include <dlog.h>

#include <cerrno>
#include <climits>
#include <cstdlib>
#include <fcntl.h>
#include <fstream>
#include <sstream>
#include <string>
#include <thread>
#include <unistd.h>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace
{

// Standard error goes to a file while this lives. The copy is on, so that the lines are there with
// and without a journal.
class Dlog : public testing::Test
{
protected:
    static void SetUpTestSuite() { setenv("PELLIKO_LOG_STDERR", "1", 1); }

    Dlog()
    {
        std::string pattern = testing::TempDir() + "dlog-XXXXXX";
        const int fd = mkostemp(pattern.data(), O_CLOEXEC);
        path_ = pattern;
        saved_ = dup(STDERR_FILENO);
        dup2(fd, STDERR_FILENO);
        close(fd);
    }
    ~Dlog() override
    {
        dup2(saved_, STDERR_FILENO);
        close(saved_);
        unlink(path_.c_str());
    }

    std::vector<std::string> lines() const
    {
        std::ifstream file(path_);
        std::vector<std::string> all;
        for (std::string line; std::getline(file, line);)
            all.push_back(line);
        return all;
    }

    static std::string head(const std::string &letterAndTag)
    {
        return letterAndTag + "(" + std::to_string(getpid()) + "): ";
    }

private:
    std::string path_;
    int saved_ = -1;
};

} // namespace

TEST_F(Dlog, WritesALineAndCountsItsBytes)
{
    EXPECT_EQ(16, dlog_print(DLOG_ERROR, "PELLIKO", "[ERROR] ret = %d", -4));
    EXPECT_THAT(lines(), testing::ElementsAre(head("E/PELLIKO") + "[ERROR] ret = -4"));
}

TEST_F(Dlog, KeepsErrno)
{
    errno = ENOENT;
    dlog_print(DLOG_INFO, "PELLIKO", "%s", std::string(100000, 'x').c_str());
    EXPECT_EQ(ENOENT, errno);
    EXPECT_EQ(head("I/PELLIKO").size() + 100000, lines().front().size());
}

TEST_F(Dlog, SilentLinesAreNotWritten)
{
    EXPECT_EQ(0, dlog_print(DLOG_SILENT, "PELLIKO", "nothing"));
    EXPECT_TRUE(lines().empty());
}

TEST_F(Dlog, RefusesWhatItCannotPrint)
{
    const char *none = nullptr;
    EXPECT_EQ(DLOG_ERROR_INVALID_PARAMETER, dlog_print(DLOG_INFO, none, "text"));
    EXPECT_EQ(DLOG_ERROR_INVALID_PARAMETER, dlog_print(DLOG_PRIO_MAX, "PELLIKO", "text"));
    EXPECT_TRUE(lines().empty());
}

TEST_F(Dlog, LinesOfManyThreadsStayWhole)
{
    constexpr int kThreads = 8;
    constexpr int kLines = 200;
    std::vector<std::thread> threads;
    for (int thread = 0; thread < kThreads; ++thread) {
        threads.emplace_back([thread] {
            for (int line = 0; line < kLines; ++line)
                dlog_print(DLOG_DEBUG, "PELLIKO", "%s",
                           std::string(300, static_cast<char>('a' + thread)).c_str());
        });
    }
    for (std::thread &thread : threads)
        thread.join();
    const std::vector<std::string> all = lines();
    EXPECT_EQ(std::size_t{kThreads} * kLines, all.size());
    for (const std::string &line : all) {
        const std::string text = line.substr(head("D/PELLIKO").size());
        EXPECT_EQ(std::string(300, text.front()), text);
    }
}
