// The launch requests that the history sends.
#pragma once

#include <cstdint>
#include <string>

namespace pelliko::history
{

/// Shares the files of an earlier request again, with people that the recipient picker asks for.
/// @return 0, or an error of the platform
int shareAgain(int32_t requestId);

/// Opens the viewer on a received share. 0, or an error of the platform.
int openViewer(const std::string &contentsToken);

} // namespace pelliko::history
