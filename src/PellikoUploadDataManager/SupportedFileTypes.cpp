#include "PellikoUploadDataManager/SupportedFileTypes.h"

#include "AppLog/AppLog.h"

#include <algorithm>
#include <cstring>
#include <iterator>
#include <strings.h>

namespace pelliko
{

namespace
{

// The order is part of the design: the first match wins, and positions stand for kinds of content.
constexpr const char *supported_extensions[] = {
    "mpeg",   "mpg",  "mp4",  "m4v",  "3gp",  "3gpp",  "3g2",  "3gpp2", "mkv",  "webm", //
    "ts",     "avi",  "ram",  "rm",   "rmvb", "wmv",   "asf",  "divx",  "flv",  "tp",   //
    "trp",    "m2ts", "mts",  "m2t",  "smi",  "mp3",   "mpga", "m4a",   "wav",  "amr",  //
    "awb",    "3ga",  "wma",  "qcp",  "evc",  "pva",   "aac",  "pyv",   "dm",   "ogg",  //
    "oga",    "mka",  "mid",  "midi", "xmf",  "rtttl", "smf",  "imy",   "rtx",  "ota",  //
    "mxmf",   "m3u",  "pls",  "wpl",  "m3u8", "fl",    "flac", "jpeg",  "jpg",  "png",  //
    "bmp",    "gif",  "agif", "webp", "wbmp", "ppt",   "pptx", "doc",   "docx", "xls",  //
    "xlsx",   "hwp",  "gul",  "pdf",  "txt",  "html",  "htm",  "vcf",   "vcs",  "vts",  //
    "invalid"};
constexpr int extensionCount = sizeof(supported_extensions) / sizeof(supported_extensions[0]) - 1;
constexpr size_t sentinelLength = 7;

// Where each further kind begins: video and subtitles, then audio and playlists, images, documents,
// cards and calendars.
constexpr int kindStarts[] = {25, 57, 65, 77};

// Only as many characters as the extension has are compared: "mp" is taken for "mpeg".
bool _matches(const char *row, const char *extension, size_t length)
{
    return strncasecmp(extension, row, length) == 0;
}

bool _isSentinel(const char *row)
{
    return strncmp(row, "invalid", sentinelLength) == 0;
}

// Which kind of content a row stands for, counted from 0.
auto _kindOf(int row)
{
    return std::upper_bound(std::begin(kindStarts), std::end(kindStarts), row) - kindStarts;
}

// The first row that the extension begins. Only when that is content of another kind the extension
// is the row of its own name: "fl" is music, though the film type "flv" stands before it.
int _rowOf(const char *extension)
{
    const size_t length = strlen(extension);
    int first = -1;
    for (int row = 0; !_isSentinel(supported_extensions[row]); ++row) {
        if (!_matches(supported_extensions[row], extension, length))
            continue;
        if (first < 0)
            first = row;
        const bool same_name = supported_extensions[row][length] == '\0';
        if (same_name && _kindOf(row) != _kindOf(first))
            return row;
    }
    return first;
}

} // namespace

int supportedExtensionPosition(const char *path)
{
    const char *dot = path ? strrchr(path, '.') : nullptr;
    return supportedExtensionRow(dot ? dot + 1 : nullptr);
}

int supportedExtensionRow(const char *extension)
{
    const int row = extension ? _rowOf(extension) : -1;
    if (row >= 0)
        LOG_DEBUG("extension[%s], match[%s]", extension, supported_extensions[row]);
    return row;
}

const char *supportedExtensionAt(int position)
{
    return position >= 0 && position < extensionCount ? supported_extensions[position] : nullptr;
}

int isSupportedFileType(const char *path)
{
    return supportedExtensionPosition(path) >= 0 ? 1 : 0;
}

} // namespace pelliko
