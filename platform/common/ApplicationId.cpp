#include "ApplicationId.h"

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <cstdlib>

namespace pelliko::platform
{

namespace
{

constexpr std::size_t kLongestBusName = 255;

bool isNameCharacter(char c)
{
    return std::isalnum(static_cast<unsigned char>(c)) != 0 || c == '_' || c == '-';
}

// A well-known bus name: at least two elements, none empty, none beginning with a digit.
bool isBusName(const std::string &name)
{
    if (name.size() > kLongestBusName || name.find('.') == std::string::npos)
        return false;
    bool elementStart = true;
    for (char c : name) {
        if (c == '.') {
            if (elementStart)
                return false;
            elementStart = true;
            continue;
        }
        if (!isNameCharacter(c) || (elementStart && std::isdigit(static_cast<unsigned char>(c))))
            return false;
        elementStart = false;
    }
    return !elementStart;
}

std::string idOfProgram()
{
    std::string name = program_invocation_short_name;
    std::replace_if(
        name.begin(), name.end(), [](char c) { return !isNameCharacter(c); }, '_');
    if (name.empty() || std::isdigit(static_cast<unsigned char>(name.front())) != 0)
        name.insert(name.begin(), '_');
    return "com.velmora." + name;
}

std::string ownId()
{
    const char *given = std::getenv("PELLIKO_APP_ID");
    return given && isBusName(given) ? given : idOfProgram();
}

} // namespace

const std::string &applicationId()
{
    static const std::string id = ownId();
    return id;
}

std::string applicationObjectPath(const std::string &id)
{
    std::string path = "/" + id;
    std::replace(path.begin(), path.end(), '.', '/');
    std::replace(path.begin(), path.end(), '-', '_');
    return path;
}

} // namespace pelliko::platform
