// The files that a command line names.
#pragma once

#include <string>
#include <vector>

namespace pelliko::command
{

/// Files as absolute paths in the order of the command line. The fault of the first that cannot be
/// shared, else empty.
struct NamedFiles {
    std::vector<std::string> paths;
    std::string fault;
};

/// Looks at what was named: paths, or the file:// addresses that desktops write.
NamedFiles readFiles(const std::vector<std::string> &names);

} // namespace pelliko::command
