// What the commands of contacts-tool do once its arguments are understood.
#pragma once

#include <string>

namespace pelliko::contacts_tool
{

enum class ExitCode : int {
    Success = 0,
    Failure = 1, ///< said on standard error
    Usage = 2,   ///< the arguments were not understood
};

struct NewContact {
    std::string name;
    std::string number;
    std::string picture; ///< file name, may be empty
    bool joined = false;
};

ExitCode importFile(const std::string &path);
ExitCode add(const NewContact &contact);
ExitCode list(bool as_json);

} // namespace pelliko::contacts_tool
