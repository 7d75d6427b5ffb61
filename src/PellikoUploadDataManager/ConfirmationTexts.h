// Body and summary of the confirmation popup. Main loop only.
#pragma once

#include <cstddef>

namespace pelliko
{

class PellikoAppData;

/// Size of each of the two popup texts with its terminating zero, in bytes.
inline constexpr std::size_t popupTextSize = 512;

/// Writes the body and, for exactly one recipient, the summary (empty otherwise) of the share in
/// hand. Both buffers hold `popupTextSize` bytes; longer texts are cut between characters. The
/// texts carry markup.
void getTextForConfirmationPopup(PellikoAppData *ad, char *body, char *summary);

} // namespace pelliko
