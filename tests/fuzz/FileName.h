// What a file's name has to be before it becomes a part of a path or of a header.
#pragma once

#include "Promise.h"

#include <algorithm>
#include <glib.h>
#include <string>

namespace pelliko::fuzz
{

/// One component of a path that names neither the folder nor the one above, in valid UTF-8 without
/// control characters.
inline void promiseFileName(const std::string &name)
{
    promise(!name.empty() && name.size() <= 255, "a name has 1 to 255 bytes");
    promise(name != "." && name != "..", "a name leads to no folder");
    promise(name.find_first_of("/\\") == std::string::npos, "a name has no folder in it");
    promise(g_utf8_validate_len(name.data(), name.size(), nullptr), "a name is UTF-8");
    promise(std::none_of(name.begin(), name.end(),
                         [](char c) { return static_cast<unsigned char>(c) < 0x20 || c == 0x7f; }),
            "a name has no control characters");
}

} // namespace pelliko::fuzz
