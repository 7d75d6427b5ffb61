// What the commands of contacts-tool do once its arguments are understood.
#pragma once

#include <string>
#include <vector>

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

struct Profile {
    std::string name;
    std::vector<std::string> numbers;
    std::string picture; ///< file name, may be empty
};

ExitCode importFile(const std::string &path);
ExitCode importEvolution();
ExitCode add(const NewContact &contact);
ExitCode list(bool as_json);

/// Writes contacts, by their contact ids, as vCards into the directory and prints the files' names.
ExitCode exportContacts(const std::vector<std::string> &ids, bool one_file, std::string directory);
ExitCode setProfile(const Profile &profile);
ExitCode showProfile();

/// Says the sentence on standard error.
ExitCode fail(const std::string &sentence);
/// Success, when the output reached its reader: it does not on a full disk.
ExitCode finish();

} // namespace pelliko::contacts_tool
