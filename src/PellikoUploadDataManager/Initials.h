// What stands for a person without a picture.
#pragma once

#include <string>

namespace pelliko
{

/// The letters that a name is known by: those of its first and last word in scripts that write
/// capitals, else the first letter alone. Empty when the name does not begin with a letter, as a
/// number does not.
std::string initialsOf(const char *name);

/// Which of the five grounds a name has: 1 to 5, always the same for the same name.
int initialsGround(const char *name);

} // namespace pelliko
