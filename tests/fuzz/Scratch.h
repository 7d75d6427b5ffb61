// A folder of its own for what a target stores.
#pragma once

#include <cstdlib>
#include <filesystem>
#include <string>

namespace pelliko::fuzz
{

/// A new folder in memory, which the platform's state and the user's settings are in from then on;
/// gone with the object.
class Scratch
{
public:
    Scratch()
    {
        std::string path = std::filesystem::is_directory("/dev/shm") ? "/dev/shm/" : "/tmp/";
        path += "pelliko-fuzz-XXXXXX";
        m_path = mkdtemp(path.data());
        for (const char *name :
             {"XDG_DATA_HOME", "XDG_STATE_HOME", "XDG_CONFIG_HOME", "XDG_RUNTIME_DIR"})
            setenv(name, m_path.c_str(), 1);
    }
    ~Scratch()
    {
        std::error_code ignored;
        std::filesystem::remove_all(m_path, ignored);
    }
    Scratch(const Scratch &) = delete;
    Scratch &operator=(const Scratch &) = delete;

    const std::filesystem::path &path() const { return m_path; }

private:
    std::filesystem::path m_path;
};

} // namespace pelliko::fuzz
