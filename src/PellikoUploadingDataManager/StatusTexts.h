// What the status popup says about the tapped upload. Main loop only.
#pragma once

#include <cstddef>

namespace pelliko
{

/// Sizes of the two lines with their terminating zeros, in bytes.
inline constexpr std::size_t statusLineSize = 500;
inline constexpr std::size_t sizeLineSize = 512;

/// The message id of a state (NotificationState), or null for a state that has none.
const char *statusLineId(int state);

/// Writes number and size of the tapped upload's files into a buffer of sizeLineSize bytes; false,
/// and the buffer as it was, when it has no size.
bool writeSizeLine(char *line);

} // namespace pelliko
