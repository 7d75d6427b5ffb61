// Who gets files that a desktop hands to an application. A desktop knows no recipients; an
// application that wants some has a picker beside it, which asks for them and passes the request
// on.
#pragma once

#include <string>

namespace pelliko::platform
{

/// The id of the application that requests for files of `id` go to: "<id>-picker" where the bus
/// knows one, else `id` itself.
std::string receiverOfFiles(const std::string &id);

} // namespace pelliko::platform
