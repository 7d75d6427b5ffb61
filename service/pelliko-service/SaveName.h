// Under which name a file that others named is saved
#pragma once

#include <string>

namespace pelliko::service
{

/** One path component of a name from outside: what follows the last slash of either kind, without
 * control characters, valid UTF-8, at most 255 bytes; "file" when nothing is left. */
std::string plainFileName(const std::string &name);

/** The name with " (number)" before its extension, at most 255 bytes. */
std::string numberedName(const std::string &name, int number);

/** Gives a finished file its name, or the name with the first free number, in the same folder;
 * never replaces one that is there. @return the new path; empty, with errno, on a failure */
std::string renameToFree(const std::string &path, const std::string &folder,
                         const std::string &name);

} // namespace pelliko::service
