// What the viewer asks of the desktop.
#pragma once

#include <functional>
#include <string>

namespace pelliko::viewer
{

/// The folder for what is fetched from elsewhere; absolute, may not be there yet.
std::string downloadFolder();

/// Name of the picture for a kind of file in the desktop's icon theme.
/// @param type MIME type; when it is empty the name decides
std::string iconName(const std::string &type, const std::string &name);

/// Opens a file with the default program for its kind.
/// @param done called once from the main loop, false when no program opened it
void openFile(const std::string &path, std::function<void(bool opened)> done);

} // namespace pelliko::viewer
