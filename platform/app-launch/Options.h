// The command line of app-launch.
#pragma once

#include <string>
#include <utility>
#include <vector>

namespace pelliko::applaunch
{

struct Options {
    using Pair = std::pair<std::string, std::string>;

    std::string app;
    std::string operation;
    std::string mime;
    std::string uri;
    std::vector<Pair> extras;
    /// In the order of the command line; pairs of the same key are one array.
    std::vector<Pair> arrayElements;
    bool waitReply = false;
};

/// Reads the command line. False when the program is done: *status is then its exit status, and
/// help or a sentence about the mistake has been printed.
bool readOptions(int argc, char **argv, Options *options, int *status);

/// Operations and keys are written by their path; the platform's namespace goes before them.
std::string withNamespace(const std::string &name);

} // namespace pelliko::applaunch
