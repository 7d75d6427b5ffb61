#include "KeyFiles.h"

#include <StateDir.h>

#include <charconv>
#include <cstdio>
#include <cstdlib>
#include <fcntl.h>
#include <fstream>
#include <sstream>
#include <unistd.h>

namespace pelliko::vconf
{

namespace
{

constexpr const char *kPersistent = "db/";
constexpr const char *kVolatile = "memory/";

bool beginsWith(const std::string &text, const char *prefix)
{
    return text.rfind(prefix, 0) == 0;
}

// Parts that begin with a dot are refused: "..", and the names of files that are being written.
bool hasPlainParts(const std::string &key)
{
    std::istringstream parts(key + "/");
    std::string part;
    while (std::getline(parts, part, '/')) {
        if (part.empty() || part.front() == '.')
            return false;
    }
    return key.find('\0') == std::string::npos;
}

std::string print(const Value &value)
{
    if (const auto *flag = std::get_if<bool>(&value))
        return std::string("bool ") + (*flag ? "1" : "0") + "\n";
    if (const auto *number = std::get_if<int>(&value))
        return "int " + std::to_string(*number) + "\n";
    return "string " + std::get<std::string>(value) + "\n";
}

std::optional<Value> parse(std::string text)
{
    if (!text.empty() && text.back() == '\n')
        text.pop_back();
    const std::size_t space = text.find(' ');
    if (space == std::string::npos)
        return std::nullopt;
    const std::string type = text.substr(0, space);
    const std::string rest = text.substr(space + 1);
    if (type == "string")
        return Value(rest);
    int number = 0;
    const auto [end, error] = std::from_chars(rest.data(), rest.data() + rest.size(), number);
    if (error != std::errc() || end != rest.data() + rest.size())
        return std::nullopt;
    if (type == "int")
        return Value(number);
    if (type == "bool" && (number == 0 || number == 1))
        return Value(number == 1);
    return std::nullopt;
}

bool writeAll(int fd, const std::string &text)
{
    std::size_t done = 0;
    while (done < text.size()) {
        const ssize_t written = write(fd, text.data() + done, text.size() - done);
        if (written < 0 && errno == EINTR)
            continue;
        if (written < 0)
            return false;
        done += static_cast<std::size_t>(written);
    }
    return true;
}

bool syncDirectory(const std::string &path)
{
    const int fd = open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (fd < 0)
        return false;
    const bool synced = fsync(fd) == 0;
    return close(fd) == 0 && synced;
}

// Leaves nothing behind when it fails.
bool replaceFile(const std::string &directory, const std::string &name, const std::string &text,
                 bool durable)
{
    std::string temporary = directory + "/." + name + ".XXXXXX";
    const int fd = mkostemp(temporary.data(), O_CLOEXEC);
    if (fd < 0)
        return false;
    bool good = writeAll(fd, text) && (!durable || fsync(fd) == 0);
    good = close(fd) == 0 && good;
    good = good && rename(temporary.c_str(), (directory + "/" + name).c_str()) == 0;
    if (!good)
        unlink(temporary.c_str());
    return good && (!durable || syncDirectory(directory));
}

} // namespace

std::string fileOfKey(const std::string &key)
{
    if (!hasPlainParts(key))
        return {};
    if (beginsWith(key, kPersistent))
        return platform::stateDirectory() + "/vconf/" + key;
    if (beginsWith(key, kVolatile))
        return platform::runtimeDirectory() + "/vconf/" + key;
    return {};
}

std::optional<Value> readKey(const std::string &key)
{
    const std::string path = fileOfKey(key);
    std::ifstream file(path, std::ios::binary);
    if (path.empty() || !file)
        return std::nullopt;
    std::ostringstream text;
    text << file.rdbuf();
    return file.bad() ? std::nullopt : parse(text.str());
}

bool writeKey(const std::string &key, const Value &value)
{
    const std::string path = fileOfKey(key);
    if (path.empty())
        return false;
    const std::size_t slash = path.rfind('/');
    const std::string directory = path.substr(0, slash);
    return platform::createPrivateDirectories(directory) &&
           replaceFile(directory, path.substr(slash + 1), print(value),
                       beginsWith(key, kPersistent));
}

} // namespace pelliko::vconf
