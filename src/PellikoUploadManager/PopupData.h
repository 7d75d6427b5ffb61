// The text by which a status is handed to the uploading-status popup.
#pragma once

#include <array>
#include <cstddef>

namespace pelliko
{

/// Bytes of the text with its terminator; a longer one is cut.
inline constexpr std::size_t popupDataSize = 20;

/// What the popup is to show.
struct PopupData {
    int status = 0; ///< PellikoUploadStatus
    double progress_percent = 0.0;
    int error_code = 0;
};

/// "status+percent+error", the same in every language.
std::array<char, popupDataSize> popupDataText(const PopupData &data);

/// Reads such a text, which it takes apart; missing pieces and a null text read as zero.
PopupData parsePopupData(char *text);

} // namespace pelliko
