// The paths of an upload's files inside one text, as its row keeps them: each ends with "?".
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

namespace pelliko
{

/// Bytes of the text with its terminator; what does not fit is left out.
inline constexpr std::size_t fileListSize = 40800;

/// The first `count` paths of the array, or those before its null; null: empty.
std::string fileListText(const char *const *paths, int32_t count);

/// The paths of such a text as a null-terminated array for g_strfreev: at most 64 for each of
/// `count` files, since a path that holds a "?" comes back as several.
char **splitFileList(const char *text, int32_t count);

} // namespace pelliko
