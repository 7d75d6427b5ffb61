// Where the host platform keeps what must survive a run, and what must not survive a reboot.
#pragma once

#include <string>

namespace pelliko::platform
{

/// "$XDG_DATA_HOME/pelliko-platform" (~/.local/share when the variable is not set), without a
/// trailing slash, created with mode 0700 when missing. Any thread. When it cannot be created the
/// name is returned all the same and the first use of a file in it fails.
std::string stateDirectory();

/// "$XDG_RUNTIME_DIR/pelliko-platform", created likewise; "<state directory>/run" when there is no
/// run-time directory.
std::string runtimeDirectory();

/// Creates `path` and its missing parents with mode 0700. False when it is no directory afterwards.
bool createPrivateDirectories(const std::string &path);

} // namespace pelliko::platform
