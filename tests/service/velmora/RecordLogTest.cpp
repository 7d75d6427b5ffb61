#include "Scene.h"

#include <cerrno>
#include <csignal>
#include <map>
#include <thread>

#include <poll.h>
#include <sched.h>
#include <sys/file.h>
#include <sys/mount.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/syscall.h>

#include <fcntl.h>

namespace pelliko::velmora::test
{
namespace
{
using Lines = std::vector<std::string>;
using RecordLogCase = OwnLog;

std::string lineOf(const std::string &writer, int number)
{
    return "{\"writer\":\"" + writer + "\",\"n\":" + std::to_string(number) + "}";
}

mode_t modeOf(const std::filesystem::path &path)
{
    struct stat info {
    };
    return lstat(path.c_str(), &info) == 0 ? info.st_mode & 07777 : 0;
}

// Every writer's lines are whole, none is missing, and each writer's own order is kept.
void expectAllOf(const Lines &lines, const std::vector<std::string> &writers, int each)
{
    std::map<std::string, int> next;
    for (const std::string &line : lines) {
        bool found = false;
        for (const std::string &writer : writers) {
            if (line == lineOf(writer, next[writer])) {
                ++next[writer];
                found = true;
                break;
            }
        }
        EXPECT_TRUE(found) << "unexpected line " << line;
    }
    for (const std::string &writer : writers) {
        EXPECT_EQ(next[writer], each) << writer;
    }
}

TEST_F(RecordLogCase, LinesComeBackInOrder)
{
    EXPECT_EQ(lines(), Lines{});
    ASSERT_EQ(log().append("one\n"), 0);
    ASSERT_EQ(log().append("two\n"), 0);
    EXPECT_EQ(lines(), (Lines{"one", "two"}));
}

TEST_F(RecordLogCase, NobodyElseMayReadIt)
{
    ASSERT_EQ(log().append("one\n"), 0);
    ASSERT_EQ(log().setCollecting(false), 0);
    EXPECT_EQ(modeOf(place.folder), 0700U);
    EXPECT_EQ(modeOf(file()), 0600U);
    EXPECT_EQ(modeOf(place.switchFile), 0600U);
}

TEST_F(RecordLogCase, TwoProcessesWritingAtOnceKeepTheirLinesWhole)
{
    constexpr int each = 500;
    std::vector<pid_t> children;
    for (const char *writer : {"a", "b"}) {
        children.push_back(startChild([&] {
            for (int i = 0; i < each; ++i) {
                EXPECT_EQ(log().append(lineOf(writer, i) + "\n"), 0);
            }
        }));
    }
    for (const pid_t child : children) {
        EXPECT_TRUE(succeeded(child));
    }
    expectAllOf(lines(), {"a", "b"}, each);
}

TEST_F(RecordLogCase, ThreadsThatTurnTheFileOverLoseNoLineOfTheLastHalf)
{
    // Room for all lines of the four threads in the two files together, not in one.
    constexpr int each = 100;
    const auto length = static_cast<int64_t>(lineOf("a", each).size() + 1);
    place.limit = 4 * each * length + 2 * length;
    const RecordLog shared = log();
    std::vector<std::thread> threads;
    for (const char *writer : {"a", "b", "c", "d"}) {
        threads.emplace_back([&shared, writer] {
            for (int i = 0; i < each; ++i) {
                EXPECT_EQ(shared.append(lineOf(writer, i) + "\n"), 0);
            }
        });
    }
    for (std::thread &thread : threads) {
        thread.join();
    }
    expectAllOf(lines(), {"a", "b", "c", "d"}, each);
    EXPECT_TRUE(std::filesystem::exists(file("usage.1.jsonl")));
}

TEST_F(RecordLogCase, TheOldestLinesGoWhenTheLimitIsReached)
{
    place.limit = 1000;
    for (int i = 0; i < 300; ++i) {
        ASSERT_EQ(log().append(lineOf("a", i) + "\n"), 0);
        uintmax_t size = std::filesystem::file_size(file());
        if (std::filesystem::exists(file("usage.1.jsonl"))) {
            size += std::filesystem::file_size(file("usage.1.jsonl"));
        }
        ASSERT_LE(size, 1000U);
    }
    const Lines kept = lines();
    ASSERT_GT(kept.size(), 20U);
    for (size_t i = 0; i < kept.size(); ++i) {
        EXPECT_EQ(kept[i], lineOf("a", 300 - static_cast<int>(kept.size() - i)));
    }
}

TEST_F(RecordLogCase, TheUsersLogMayTakeOneMebibyte)
{
    EXPECT_EQ(RecordLogPlace::ofUser().limit, 1048576);
}

TEST_F(RecordLogCase, ALineThatCanNeverFitIsRefused)
{
    place.limit = 100;
    EXPECT_EQ(log().append(std::string(50, 'x') + "\n"), -EINVAL);
    EXPECT_EQ(log().append(std::string(49, 'x') + "\n"), 0);
    EXPECT_EQ(lines(), Lines{std::string(49, 'x')});
}

TEST_F(RecordLogCase, AfterHalfALineTheNextOneStartsOnItsOwn)
{
    ASSERT_EQ(log().append("one\n"), 0);
    std::ofstream(file(), std::ios::app) << "{\"ti";
    ASSERT_EQ(log().append("two\n"), 0);
    EXPECT_EQ(lines(), (Lines{"one", "{\"ti", "two"}));
}

TEST_F(RecordLogCase, OffStopsCollectingUntilOn)
{
    ASSERT_EQ(log().append("one\n"), 0);
    EXPECT_TRUE(log().collecting());
    ASSERT_EQ(log().setCollecting(false), 0);
    ASSERT_EQ(log().setCollecting(false), 0);
    EXPECT_FALSE(log().collecting());
    EXPECT_EQ(log().append("two\n"), -EPERM);
    EXPECT_EQ(lines(), Lines{"one"});
    ASSERT_EQ(log().clear(), 0);
    EXPECT_FALSE(log().collecting());
    ASSERT_EQ(log().setCollecting(true), 0);
    ASSERT_EQ(log().setCollecting(true), 0);
    EXPECT_EQ(log().append("three\n"), 0);
    EXPECT_EQ(lines(), Lines{"three"});
}

// Whether none of the children ends while nothing stands in their way but what the caller holds. A
// child that is slow to begin makes this pass, never fail.
bool allWait(const std::vector<pid_t> &children)
{
    constexpr int patience = 300;
    std::vector<pollfd> ended;
    for (const pid_t child : children) {
        ended.push_back({static_cast<int>(syscall(SYS_pidfd_open, child, 0)), POLLIN, 0});
    }
    const int ready = poll(ended.data(), ended.size(), patience);
    for (const pollfd &one : ended) {
        close(one.fd);
    }
    return ready == 0;
}

TEST_F(RecordLogCase, EverybodyWaitsForWhoeverIsWorkingOnTheRecords)
{
    ASSERT_EQ(log().append("one\n"), 0);
    const int held = open(place.folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    ASSERT_EQ(flock(held, LOCK_EX), 0);
    const std::vector<pid_t> children = {
        startChild([&] {
            close(held);
            EXPECT_EQ(log().append("two\n"), -EPERM); // it was switched off meanwhile
        }),
        startChild([&] {
            close(held);
            EXPECT_EQ(lines(), Lines{"changed"});
        }),
        startChild([&] {
            close(held);
            EXPECT_EQ(log().setCollecting(false), 0);
        }),
    };
    EXPECT_TRUE(allWait(children));
    std::ofstream(file()) << "changed\n";
    std::filesystem::create_directories(home / "config" / "velmora");
    std::ofstream(place.switchFile) << "";
    close(held);
    for (const pid_t child : children) {
        EXPECT_TRUE(succeeded(child));
    }
    EXPECT_EQ(lines(), Lines{"changed"});
}

TEST_F(RecordLogCase, OffWorksWhereNoRecordCanBeWritten)
{
    std::ofstream(home / "state") << "in the way";
    EXPECT_EQ(log().setCollecting(false), 0);
    EXPECT_FALSE(log().collecting());
}

TEST_F(RecordLogCase, AChoiceThatCannotBeKeptIsSaid)
{
    std::ofstream(home / "config") << "in the way";
    EXPECT_EQ(log().setCollecting(false), -ENOTDIR);
    EXPECT_TRUE(log().collecting());
    EXPECT_EQ(log().setCollecting(true), 0);
}

TEST_F(RecordLogCase, ASwitchThatCannotBeLookedAtCountsAsOff)
{
    place.switchFile = home / std::string(300, 'x');
    EXPECT_EQ(log().append("one\n"), -EPERM);
}

TEST_F(RecordLogCase, ClearTakesBothFilesAway)
{
    place.limit = 20;
    ASSERT_EQ(log().append("first\n"), 0);
    ASSERT_EQ(log().append("second\n"), 0);
    ASSERT_TRUE(std::filesystem::exists(file("usage.1.jsonl")));
    ASSERT_EQ(log().clear(), 0);
    EXPECT_TRUE(std::filesystem::is_empty(place.folder));
    EXPECT_EQ(log().clear(), 0);
}

TEST_F(RecordLogCase, AFolderThatIsTakenAwayIsMadeAgain)
{
    ASSERT_EQ(log().append("one\n"), 0);
    std::filesystem::remove_all(place.folder);
    ASSERT_EQ(log().append("two\n"), 0);
    EXPECT_EQ(lines(), Lines{"two"});
}

TEST_F(RecordLogCase, AFolderThatCannotBeMadeIsAnError)
{
    std::ofstream(home / "state") << "in the way";
    EXPECT_EQ(log().prepare(), -ENOTDIR);
    EXPECT_EQ(log().append("one\n"), -ENOTDIR);
}

TEST_F(RecordLogCase, AFolderWithoutPermissionIsAnError)
{
    ASSERT_EQ(log().prepare(), 0);
    std::filesystem::permissions(place.folder, std::filesystem::perms::owner_read |
                                                   std::filesystem::perms::owner_exec);
    EXPECT_TRUE(succeeded(startChild([&] {
        // To the administrator every folder is open.
        if (geteuid() == 0) {
            ASSERT_EQ(chown(home.c_str(), 65534, 65534), 0);
            ASSERT_EQ(chown((home / "state").c_str(), 65534, 65534), 0);
            ASSERT_EQ(chown(place.folder.c_str(), 65534, 65534), 0);
            ASSERT_EQ(setuid(65534), 0);
        }
        EXPECT_EQ(log().append("one\n"), -EACCES);
    })));
}

TEST_F(RecordLogCase, SomethingElseUnderTheNameIsAnError)
{
    ASSERT_EQ(log().prepare(), 0);
    std::ofstream(home / "target") << "";
    std::filesystem::create_symlink(home / "target", file());
    EXPECT_EQ(log().append("one\n"), -ELOOP);
    EXPECT_EQ(std::filesystem::file_size(home / "target"), 0U);
    std::filesystem::remove(file());
    ASSERT_EQ(mkfifo(file().c_str(), 0600), 0);
    EXPECT_EQ(log().append("one\n"), -EIO);
}

TEST_F(RecordLogCase, AtTheSizeLimitOfTheProcessNoHalfLineIsLeft)
{
    ASSERT_EQ(log().append("one\n"), 0);
    EXPECT_TRUE(succeeded(startChild([&] {
        std::signal(SIGXFSZ, SIG_IGN);
        const rlimit limit = {10, 10};
        ASSERT_EQ(setrlimit(RLIMIT_FSIZE, &limit), 0);
        EXPECT_EQ(log().append("too long for the rest\n"), -ENOSPC);
        EXPECT_EQ(log().append("two\n"), 0);
    })));
    EXPECT_EQ(lines(), (Lines{"one", "two"}));
}

// A file system of one page for the records, in a mount namespace of the child's own.
void mountSmallDisk(const std::string &folder)
{
    const uid_t user = getuid();
    const gid_t group = getgid();
    if (user == 0) { // needs no user namespace, which a container may refuse
        ASSERT_EQ(unshare(CLONE_NEWNS), 0) << strerror(errno);
    } else {
        ASSERT_EQ(unshare(CLONE_NEWUSER | CLONE_NEWNS), 0) << strerror(errno);
        std::ofstream("/proc/self/setgroups") << "deny";
        std::ofstream("/proc/self/uid_map") << "0 " << user << " 1";
        std::ofstream("/proc/self/gid_map") << "0 " << group << " 1";
    }
    ASSERT_EQ(mount("none", "/", nullptr, MS_REC | MS_PRIVATE, nullptr), 0) << strerror(errno);
    ASSERT_EQ(mount("tmpfs", folder.c_str(), "tmpfs", 0, "size=4k,mode=700"), 0) << strerror(errno);
}

TEST_F(RecordLogCase, OnAFullDiskNoHalfLineIsLeftAndRoomIsUsedAgain)
{
    ASSERT_EQ(log().prepare(), 0);
    EXPECT_TRUE(succeeded(startChild([&] {
        mountSmallDisk(place.folder);
        if (testing::Test::HasFatalFailure()) {
            return;
        }
        const std::string line(299, 'x');
        int fitting = 0;
        while (fitting < 20 && log().append(line + "\n") == 0) {
            ++fitting;
        }
        EXPECT_EQ(fitting, 4096 / 300);
        EXPECT_EQ(log().append(line + "\n"), -ENOSPC);
        EXPECT_EQ(lines(), Lines(static_cast<size_t>(fitting), line));
        EXPECT_EQ(log().append("short\n"), 0);
        EXPECT_EQ(lines().back(), "short");
        ASSERT_EQ(log().clear(), 0);
        EXPECT_EQ(log().append(line + "\n"), 0);
    })));
}
} // namespace
} // namespace pelliko::velmora::test
