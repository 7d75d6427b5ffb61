// Sharing files and text from the command line.
#pragma once

#include "Output.h"

#include <string>
#include <vector>

namespace pelliko::command
{

/// Hands files to the application, or without recipients to the recipient picker.
/// @param to names or numbers
Exit shareFiles(const std::vector<std::string> &names, const std::vector<std::string> &to);

/// The same for a text: the words with blanks between them, or standard input for none and for "-".
Exit shareText(const std::vector<std::string> &words, const std::vector<std::string> &to);

} // namespace pelliko::command
