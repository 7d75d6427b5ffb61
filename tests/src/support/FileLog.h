#pragma once

#include <fstream>
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
        std::ofstream(logPath, std::ios::app);
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

    /// The messages alone.
    std::vector<std::string> messages() const
    {
        std::vector<std::string> all = lines();
        for (std::string &line : all) {
            const size_t end = line.find(") > ");
            line = end == std::string::npos ? line : line.substr(end + 4);
        }
        return all;
    }

private:
    std::streamoff start_ = 0;
};

} // namespace pelliko::test
