// How a received share is told to the user.
#pragma once

#include "Saving.h"

#include <KeptShares.h>
#include <RowTexts.h>

namespace pelliko::viewer
{

/// "Ann shared 3 files with you".
std::string titleText(const companion::ReceivedShare &share);

/// "3 files, 2.4 MB. Available until …".
std::string summaryText(const companion::ReceivedShare &share);

/// Why the share cannot be shown or fetched, and what to do; empty for code 0.
/// @param code of pelliko_shares.h
std::string faultText(int code);

/// The row of one file.
companion::RowTexts rowOf(const companion::ShareFile &file, const FileState &state);

/// What a round of saving came to, with the reason when it stopped.
std::string outcomeText(const Saving &saving);

} // namespace pelliko::viewer
