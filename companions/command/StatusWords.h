// How an upload is told on a terminal and to programs.
#pragma once

#include <KeptShares.h>

#include <string>

namespace pelliko::command
{

/// One word for programs: uploading, paused, telling, available, expired, withdrawing, withdrawn,
/// cancelled or failed.
const char *stateWord(pelliko_share_state_e state);

/// "uploading 43 %", "available until 2026-11-28 12:00".
std::string stateText(const companion::SentShare &share);

/// "3 files, 2.4 MB for Anna Berg and 2 more".
std::string contentText(const companion::SentShare &share);

/// All of it on one line.
std::string jsonOf(const companion::SentShare &share);

} // namespace pelliko::command
