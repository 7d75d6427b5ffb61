#pragma once

namespace pelliko
{

/// Position of the first row of the extension table that matches the path's extension (what follows
/// the last "." of the whole text), or -1. Ignores case; an extension that begins a row matches it.
/// A match is logged. The file is not touched; null has no extension. Any thread.
int supportedExtensionPosition(const char *path);

/// The same for an extension that stands alone, "jpg" or "JPG"; null has no row.
int supportedExtensionRow(const char *extension);

/// The row at a position given by supportedExtensionPosition, for example "jpg"; null outside the
/// table.
const char *supportedExtensionAt(int position);

/// 1 when the path's extension is in the table, else 0.
int isSupportedFileType(const char *path);

} // namespace pelliko
