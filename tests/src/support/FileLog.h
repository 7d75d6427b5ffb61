#pragma once

#include <algorithm>
#include <fstream>
#include <regex>
#include <string>
#include <vector>

namespace pelliko::test
{

constexpr const char *applicationHome = "/opt/usr/apps/com.velmora.pelliko";
constexpr const char *logDirectory = "/opt/usr/apps/com.velmora.pelliko/data/.app-logs";
constexpr const char *logPath = "/opt/usr/apps/com.velmora.pelliko/data/.app-logs/app.log";

/// What the application wrote to its file log from here on.
class FileLog
{
public:
    FileLog()
    {
        const std::ofstream created(logPath, std::ios::app);
        restart();
    }

    /// Forgets what was written until now.
    void restart() { start_ = std::ifstream(logPath, std::ios::ate).tellg(); }

    /// Whole lines, with time, thread, tag and place.
    std::vector<std::string> lines() const
    {
        std::ifstream in(logPath);
        in.seekg(start_);
        std::vector<std::string> all;
        for (std::string line; std::getline(in, line);)
            all.push_back(line);
        return all;
    }

    /// The messages alone. What the usage log answers is left out: it comes whenever the loop is
    /// free, between any two others.
    std::vector<std::string> messages() const
    {
        std::vector<std::string> all = lines();
        for (std::string &line : all) {
            const size_t end = line.find(") > ");
            line = end == std::string::npos ? line : line.substr(end + 4);
        }
        std::erase_if(all, [](const std::string &message) {
            return message.starts_with("request ID[") &&
                   message.find("] completed, uri[") != std::string::npos;
        });
        return all;
    }

    /// Every message on a line of its own, addresses written as "%p".
    std::string text() const
    {
        static const std::regex address("0x[0-9a-f]+|\\(nil\\)");
        std::string all;
        for (const std::string &message : messages())
            all += message + "\n";
        return std::regex_replace(all, address, "%p");
    }

    /// Whether one message equals `message`.
    bool has(const std::string &message) const
    {
        const std::vector<std::string> all = messages();
        return std::find(all.begin(), all.end(), message) != all.end();
    }

private:
    std::streamoff start_ = 0;
};

} // namespace pelliko::test
