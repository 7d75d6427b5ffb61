// The id under which a program is known on the platform; its bus name and the owner of its
// preferences.
#pragma once

#include <string>

namespace pelliko::platform
{

/// The id of the running program: PELLIKO_APP_ID when it is set and a valid bus name, otherwise
/// "com.velmora." followed by the program's own file name (characters that a bus name cannot carry
/// become '_'). Constant for the life of the process. Any thread.
const std::string &applicationId();

/// The object path of an application: "/" + id with '.' -> '/' and '-' -> '_'.
std::string applicationObjectPath(const std::string &id);

} // namespace pelliko::platform
