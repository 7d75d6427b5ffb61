// The command line of a program that is opened by others and takes no arguments.
#pragma once

#include <optional>

namespace pelliko::companion
{

/// Tells what the program does after --help, and that it takes no arguments after anything else.
/// The status to end with then; nothing when there were no arguments.
std::optional<int> answerArguments(int argc, char **argv, const char *what);

} // namespace pelliko::companion
