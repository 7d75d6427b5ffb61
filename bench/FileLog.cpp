// What a line of the application's file log takes next to opening, appending to and closing a file
// with plain system calls, and a rotation next to the run of tar in it.
#include <cstdio>
#include <cstdlib>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <mutex>
#include <string>
#include <thread>
#include <unistd.h>
#include <vector>

#include "AppLog/AppLog.h"
#include "Turns.h"

using namespace pelliko::bench;

namespace
{

constexpr const char *folder = "/opt/usr/apps/com.velmora.pelliko/data/.app-logs";
constexpr int linesOfRound = 4000;
constexpr size_t almostFull =
    (5 << 20) - 20; // the next line reaches the size at which the log rotates
constexpr double mostPerLine = 1.5, mostPerRotation = 1.1;

std::string pathOf(const std::string &name)
{
    return std::string(folder) + "/" + name;
}

[[noreturn]] void giveUp(const std::string &reason)
{
    std::fprintf(stderr, "file-log: %s\n", reason.c_str());
    std::exit(2);
}

void writeLogLine(int number)
{
    pelliko::appLogWrite("FileLog.cpp", "writeLogLine", 42, "PELLIKO:MESSAGE",
                         "Progress of the upload %d is now at 42 percent of its files", number);
}

// As long as a line of the log, and made beforehand.
const std::string plainLine =
    "2026-11-21 12:34:56 (123456) [PELLIKO:MESSAGE] FileLog.cpp: writeLogLine(42) > "
    "Progress of the upload 1234 is now at 42 percent of its files\n";

void appendPlainLine(int)
{
    static const std::string path = pathOf("plain.log");
    const int file = open(path.c_str(), O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC, 0644);
    if (file < 0 || write(file, plainLine.data(), plainLine.size()) < 0 || close(file) != 0)
        giveUp("cannot write " + path);
}

// The log's lines stand in the order of their times, so two are never written at once.
void appendPlainLineAlone(int number)
{
    static std::mutex one;
    const std::lock_guard lock(one);
    appendPlainLine(number);
}

// Microseconds per line on the clock, when so many threads write at once.
double perLine(void (*writeOne)(int), int threads)
{
    for (const char *name : {"app.log", "plain.log"})
        std::filesystem::remove(pathOf(name));
    const auto part = [=] {
        for (int i = 0; i < linesOfRound / threads; ++i)
            writeOne(i);
    };
    const double seconds = secondsOf([&] {
        std::vector<std::thread> others;
        for (int i = 1; i < threads; ++i)
            others.emplace_back(part);
        part();
        for (std::thread &other : others)
            other.join();
    });
    return 1e6 * seconds / linesOfRound;
}

// A log that has become full over days is on the disk, and so are its archives.
void settle()
{
    for (const auto &entry : std::filesystem::directory_iterator(folder)) {
        const int file = open(entry.path().c_str(), O_RDONLY | O_CLOEXEC);
        if (file < 0 || fsync(file) != 0 || close(file) != 0)
            giveUp("cannot write " + entry.path().string());
    }
}

// Different lines, as packing equal ones would be too easy.
void fill(const std::string &name)
{
    std::ofstream file(pathOf(name), std::ios::trunc);
    for (int i = 0; static_cast<size_t>(file.tellp()) < almostFull; ++i) {
        std::string line = plainLine;
        line.insert(line.size() - 1, std::to_string(i * 7919LL * 104729));
        line.resize(std::min(line.size(), almostFull - static_cast<size_t>(file.tellp())));
        file << line;
    }
    file.close();
    settle();
}

double rotation()
{
    fill("app.log");
    const double seconds = secondsOf([] { writeLogLine(0); });
    if (std::filesystem::file_size(pathOf("app.log")) != 0)
        giveUp("the log has not rotated");
    return 1e3 * seconds;
}

double tarAlone()
{
    fill("plain.log");
    const std::string command =
        "tar -czf " + pathOf("plain.tar.gz") + " -C " + folder + " plain.log";
    return 1e3 * secondsOf([&] {
               if (std::system(command.c_str()) != 0)
                   giveUp("tar does not run");
           });
}

bool compareLines(int rounds, int threads)
{
    const std::string who = std::to_string(threads) + (threads == 1 ? " thread" : " threads");
    std::vector<Side> sides = {
        {"a line of the log, " + who, [=] { return perLine(writeLogLine, threads); }},
        {"open, write, close, " + who, [=] { return perLine(appendPlainLine, threads); }}};
    if (threads > 1)
        sides.push_back({"the same, one thread at a time",
                         [=] { return perLine(appendPlainLineAlone, threads); }});
    const auto medians = mediansInTurns(rounds, sides, "µs");
    std::printf("%.0f against %.0f lines a second\n", 1e6 / medians[0], 1e6 / medians[1]);
    if (threads > 1)
        std::printf("a line, %s / one thread at a time = %.2f\n", who.c_str(),
                    medians[0] / medians[2]);
    return judge("a line, " + who, medians[0], medians[1], mostPerLine);
}

} // namespace

int main(int argc, char **argv)
{
    const int rounds =
        roundsOf(argc, argv, 15,
                 "Compares the file log with plain system calls and its rotation with tar. Runs in "
                 "a private world:\n"
                 "scripts/session --no-display --no-server -- build/release/bench/file-log");
    if (!std::filesystem::is_directory(folder))
        giveUp("it needs a private world (scripts/session)");
    bool good = compareLines(rounds, 1);
    good = compareLines(rounds, 4) && good;
    const auto medians = mediansInTurns(
        rounds, {{"a line that rotates the log", rotation}, {"tar alone", tarAlone}}, "ms");
    good = judge("a rotation", medians[0], medians[1], mostPerRotation) && good;
    return good ? 0 : 1;
}
