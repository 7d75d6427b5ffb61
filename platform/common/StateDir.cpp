#include "StateDir.h"

#include <cstdlib>
#include <filesystem>
#include <sys/stat.h>

namespace pelliko::platform
{

namespace
{

std::string environment(const char *name)
{
    const char *value = std::getenv(name);
    return value ? value : "";
}

std::string dataHome()
{
    std::string home = environment("XDG_DATA_HOME");
    if (home.empty())
        home = environment("HOME") + "/.local/share";
    return home;
}

} // namespace

bool createPrivateDirectories(const std::string &path)
{
    for (std::size_t end = path.find('/', 1);; end = path.find('/', end + 1)) {
        mkdir(path.substr(0, end).c_str(), S_IRWXU);
        if (end == std::string::npos)
            break;
    }
    std::error_code error;
    return std::filesystem::is_directory(path, error);
}

std::string stateDirectory()
{
    std::string path = dataHome() + "/pelliko-platform";
    createPrivateDirectories(path);
    return path;
}

std::string runtimeDirectory()
{
    const std::string base = environment("XDG_RUNTIME_DIR");
    std::string path = base.empty() ? stateDirectory() + "/run" : base + "/pelliko-platform";
    createPrivateDirectories(path);
    return path;
}

} // namespace pelliko::platform
