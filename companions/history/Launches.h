// The launch requests that the history sends.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace pelliko::history
{

/// How many people one request to share can name.
inline constexpr size_t mostRecipients = 10;

/// Asks the application to share the files of an earlier request again.
/// @param numberIds of the contacts store; 1 to mostRecipients
/// @return 0, or an error of the platform
int shareAgain(int32_t requestId, const std::vector<int32_t> &numberIds);

/// Opens the viewer on a received share. 0, or an error of the platform.
int openViewer(const std::string &contentsToken);

} // namespace pelliko::history
